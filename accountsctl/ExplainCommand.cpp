#include "accountsctl/ExplainCommand.h"

#include <optional>
#include <utility>

#include "accountsctl/JSONText.h"
#include "commandline/PlatformError.h"
#include "platform/linux/FileContents.h"
#include "report/AccountStory.h"

namespace accounts {

CommandResult explain(const ExplainOptions& options, const CommandWorker& worker) {
  const auto text = readHostFile(options.report);
  if (!text) {
    return programErrorOf(text.error(), ExitStatus::MissingInput);
  }
  worker.giveUpRights({.size = text->size()});
  const JSON report = JSON::parse(*text, nullptr, /*allow_exceptions=*/false);
  if (!report.is_object() || !report.contains("stages")) {
    return ProgramError{ExitStatus::MalformedInput,
                        pathFailure("read the report", nameOfInput(options.report),
                                    "It is none that plan or run --report wrote")
                            .text};
  }
  std::optional<std::string> story = accountStory(report, options.identifier);
  if (!story) {
    return ProgramError{
        ExitStatus::MissingInput,
        nameOfInput(options.report) + " has no account with the identifier " + options.identifier};
  }
  if (!options.reportsJSON) {
    return CommandReport{*std::move(story)};
  }
  JSON object = reportObject("explain");
  object["report"] = options.report;
  object["identifier"] = options.identifier;
  JSON lines = JSON::array();
  for (std::size_t begin = 0, end = 0; (end = story->find('\n', begin)) != std::string::npos;
       begin = end + 1) {
    lines.push_back(story->substr(begin, end - begin));
  }
  object["story"] = std::move(lines);
  return CommandReport{lineOf(std::move(object), ExitStatus::Success)};
}

}  // namespace accounts
