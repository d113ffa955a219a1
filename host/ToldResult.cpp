#include "host/ToldResult.h"

#include <utility>

#include "commandline/ShellWord.h"
#include "host/ReportFiles.h"
#include "propertylist/value/Description.h"
#include "report/AccountStory.h"
#include "report/ReportText.h"
#include "safetynet/FlatBytes.h"

namespace accounts {
namespace {

constexpr std::size_t kLongestText = std::size_t{1} << 30;

void add(FlatWriter& writer, const std::vector<std::string>& texts) {
  writer.add(static_cast<std::uint32_t>(texts.size()));
  for (const std::string& each : texts) {
    writer.addText(each);
  }
}

void add(FlatWriter& writer, const std::optional<std::string>& text) {
  writer.add(static_cast<std::uint8_t>(text.has_value()));
  writer.addText(text.value_or(""));
}

std::vector<std::string> takeTexts(FlatReader& reader) {
  std::vector<std::string> texts;
  const auto count = reader.take<std::uint32_t>();
  for (std::uint32_t number = 0; number < count && reader.isGood(); ++number) {
    texts.push_back(reader.takeText(kLongestText));
  }
  return texts;
}

std::optional<std::string> takeOptionalText(FlatReader& reader) {
  const bool isThere = reader.takeBoolean();
  std::string text = reader.takeText(kLongestText);
  return isThere ? std::optional(std::move(text)) : std::nullopt;
}

std::string storyText(const JSON& report, const std::string& account) {
  const std::optional<std::string> story = accountStory(report, account);
  return story ? *story : "No account has, or had, the identifier " + escapedText(account) + "\n";
}

}  // namespace

std::string bytesOf(const RunConclusion& conclusion) {
  FlatWriter writer;
  writer.add(static_cast<std::uint8_t>(conclusion.exitStatus));
  writer.add(static_cast<std::uint8_t>(conclusion.isCommitted));
  add(writer, conclusion.error ? std::optional(conclusion.error->message) : std::nullopt);
  add(writer, conclusion.keptFolder);
  add(writer, conclusion.warnings);
  add(writer, conclusion.earlierFolders);
  return writer.take();
}

std::optional<RunConclusion> conclusionFrom(std::string_view bytes) {
  FlatReader reader(bytes);
  RunConclusion conclusion;
  conclusion.exitStatus = static_cast<ExitStatus>(reader.take<std::uint8_t>());
  conclusion.isCommitted = reader.takeBoolean();
  if (auto message = takeOptionalText(reader)) {
    conclusion.error = ProgramError{conclusion.exitStatus, *std::move(message)};
  }
  conclusion.keptFolder = takeOptionalText(reader);
  conclusion.warnings = takeTexts(reader);
  conclusion.earlierFolders = takeTexts(reader);
  return reader.isGood() && reader.isAtEnd() ? std::optional(std::move(conclusion)) : std::nullopt;
}

std::string bytesOfWriting(const OrProgramError<void>& written) {
  FlatWriter writer;
  if (!written) {
    writer.add(static_cast<std::uint8_t>(written.error().exitStatus));
    writer.addText(written.error().message);
  }
  return writer.take();
}

OrProgramError<void> writingFrom(std::string_view bytes) {
  FlatReader reader(bytes);
  const auto exitStatus = static_cast<ExitStatus>(reader.take<std::uint8_t>());
  std::string message = reader.takeText(kLongestText);
  return reader.isGood() ? ProgramError{exitStatus, std::move(message)} : OrProgramError<void>();
}

std::string_view commandOf(const RunOptions& options) {
  return options.purpose == RunPurpose::Plan ? "plan" : "run";
}

ToldResult toldResult(const RunOptions& options, const RunReport& report,
                      const RecordedMigration& recorded) {
  ToldResult told{report.warnings, report.error, {}};
  if (options.purpose == RunPurpose::Plan) {
    const JSON full = fullReport(commandOf(options), report, recorded);
    told.result = options.wantsJSON ? lineOf(full) + "\n"
                  : options.account ? storyText(full, *options.account)
                                    : reportText(full, options.terminal);
  } else {
    told.result = options.wantsJSON ? jsonText(report) + "\n" : summaryText(report);
  }
  return told;
}

std::string bytesOf(const ToldResult& told) {
  FlatWriter writer;
  add(writer, told.warnings);
  add(writer, told.error);
  writer.addText(told.result);
  return writer.take();
}

std::optional<ToldResult> toldResultFrom(std::string_view bytes) {
  FlatReader reader(bytes);
  ToldResult told;
  told.warnings = takeTexts(reader);
  told.error = takeOptionalText(reader);
  told.result = reader.takeText(kLongestText);
  return reader.isGood() && reader.isAtEnd() ? std::optional(std::move(told)) : std::nullopt;
}

std::string restoreCommand(const DeviceOptions& options, std::string_view folder) {
  std::string command = "migration-host restore --root " + shellWord(options.root);
  if (options.home) {
    command += " --home " + shellWord(*options.home);
  }
  return command + " --from " + shellWord(folder.substr(folder.rfind('/') + 1));
}

void note(RunReport& report, const RunConclusion& conclusion, const RunOptions& options) {
  report.root = options.device.root;
  report.exitStatus = conclusion.exitStatus;
  if (conclusion.error) {
    report.error = conclusion.error->message;
  }
  report.warnings.insert(report.warnings.end(), conclusion.warnings.begin(),
                         conclusion.warnings.end());
  for (const std::string& folder : conclusion.earlierFolders) {
    report.warnings.push_back("An earlier run left files in " + folder + "; \"" +
                              restoreCommand(options.device, folder) + "\" puts them back");
  }
  report.keptInputs = conclusion.earlierFolders;
  report.keptFolder = conclusion.keptFolder;
  if (conclusion.keptFolder) {
    report.keptInputs.push_back(*conclusion.keptFolder);
  }
}

}  // namespace accounts
