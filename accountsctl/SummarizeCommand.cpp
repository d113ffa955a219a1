#include "accountsctl/SummarizeCommand.h"

#include <fmt/format.h>

#include <algorithm>
#include <cerrno>
#include <filesystem>
#include <fstream>
#include <iostream>
#include <sstream>
#include <unordered_set>

#include "accountsctl/FleetPage.h"
#include "accountsctl/FleetSummary.h"
#include "accountsctl/JSONText.h"
#include "accountsctl/ProgressLine.h"
#include "accountsctl/TextTable.h"
#include "commandline/PlatformError.h"
#include "commandline/ReplacedFile.h"
#include "platform/linux/FileContents.h"
#include "propertylist/value/Description.h"

namespace accounts {
namespace {

/// People look for what is frequent; the JSON object has the others as well.
constexpr std::size_t kShownErrors = 10;

/// Reads every line of a stream; whether it came to its end.
bool addLines(std::istream& stream, const std::optional<std::string>& page,
              const SummarizeOptions& options, FleetSummary& summary, ProgressLine& progress) {
  for (std::string line; std::getline(stream, line);) {
    summary.addLine(line, page);
    if (progress.wantsText()) {
      progress.show(progressText(summary, options.expected));
    }
  }
  return !stream.bad();
}

/// The page of the report that a file holds: it has the same name, but for its end.
std::optional<std::string> pageBeside(const std::string& file) {
  std::filesystem::path page(file);
  if (page.extension() != ".json") {
    return std::nullopt;
  }
  std::error_code error;
  page = std::filesystem::absolute(page.replace_extension(".html"), error);
  return std::filesystem::is_regular_file(page, error) ? std::optional(page.lexically_normal())
                                                       : std::nullopt;
}

/// The files that a name stands for: those of a directory that are no hidden ones, in their order.
std::vector<std::string> filesOf(const std::string& name) {
  std::error_code error;
  if (!std::filesystem::is_directory(name, error)) {
    return {name};
  }
  std::vector<std::string> files;
  for (const auto& entry : std::filesystem::directory_iterator(name, error)) {
    const std::filesystem::path& path = entry.path();
    if (path.extension() == ".json" && !path.filename().string().starts_with('.')) {
      files.push_back(path.string());
    }
  }
  if (error) {
    // Reading it tells why.
    return {name};
  }
  std::sort(files.begin(), files.end());
  return files;
}

std::optional<ProgramError> addFile(const std::string& file, const SummarizeOptions& options,
                                    FleetSummary& summary, ProgressLine& progress) {
  errno = 0;
  bool isRead = false;
  if (file == kStandardStream) {
    isRead = addLines(std::cin, std::nullopt, options, summary, progress);
  } else {
    std::ifstream stream(file, std::ios::binary);
    isRead = stream.is_open() && addLines(stream, pageBeside(file), options, summary, progress);
  }
  if (isRead) {
    return std::nullopt;
  }
  return programErrorOf(pathFailure("read", file, errno), ExitStatus::MissingInput);
}

/// The roots in a file, each once. Lines may end as on another system, and blank ones are none.
std::variant<std::vector<std::string>, ProgramError> readRoots(const std::string& file) {
  Failure error;
  const std::optional<std::string> text = readHostFile(file, error);
  if (!text) {
    return programErrorOf(error, ExitStatus::MissingInput);
  }
  std::vector<std::string> roots;
  std::unordered_set<std::string> known;
  std::istringstream lines(*text);
  for (std::string line; std::getline(lines, line);) {
    if (line.ends_with('\r')) {
      line.pop_back();
    }
    if (line.find_first_not_of(" \t") != std::string::npos && known.insert(line).second) {
      roots.push_back(line);
    }
  }
  return roots;
}

std::size_t missingCount(const SummarizeOptions& options, const FleetSummary& summary) {
  const std::size_t expected = options.expected.value_or(0);
  return expected > summary.imageCount() ? expected - summary.imageCount() : 0;
}

/// For programs the names as they are; a terminal gets nothing that it could take for a command.
std::string listText(const std::vector<std::string>& roots, bool endsWithNull,
                     const Terminal& terminal) {
  std::string text;
  for (const std::string& root : roots) {
    text += terminal.isInteractive ? escapedText(root) : root;
    text += endsWithNull ? '\0' : '\n';
  }
  return text;
}

/// Each root with why it is in the list, ROOT standing for it.
std::string reasonsText(const std::vector<const RunResult*>& results, const Terminal& terminal) {
  TextTable table({"", ""});
  table.keepWhole(0);
  for (const RunResult* result : results) {
    for (const std::string& loss : result->losses) {
      table.addRow({*result->root, loss});
    }
    if (result->losses.empty()) {
      table.addRow({*result->root,
                    result->error.value_or(std::string(outcomeOf(result->exitStatus).words))});
    }
  }
  return table.text(terminal);
}

std::string listOf(const ListedImages& images, const SummarizeOptions& options,
                   const FleetSummary& summary, const Terminal& terminal) {
  if (!images.remedy) {
    return listText(summary.missingRoots(), options.endsWithNull, terminal);
  }
  return options.withReasons
             ? reasonsText(summary.resultsWith(*images.remedy), terminal)
             : listText(summary.rootsWith(*images.remedy), options.endsWithNull, terminal);
}

std::string outcomesText(const SummarizeOptions& options, const FleetSummary& summary,
                         const Terminal& terminal) {
  TextTable table({"Images", "Status", "Outcome"});
  for (const auto& [exitStatus, count] : summary.exitStatuses()) {
    table.addRow({std::to_string(count), std::to_string(exitStatus),
                  std::string(outcomeOf(exitStatus).words)});
  }
  if (const std::size_t missing = missingCount(options, summary); missing > 0) {
    table.addRow({std::to_string(missing), "", "no result yet"});
  }
  table.addRow({std::to_string(summary.imageCount()), "", "all results"});
  return table.text(terminal);
}

std::string countsText(const char* heading, const Counts<std::string>& counts, std::size_t shown,
                       const Terminal& terminal) {
  if (counts.empty()) {
    return "";
  }
  TextTable table({"Images", heading});
  for (std::size_t row = 0; row < std::min(shown, counts.size()); ++row) {
    table.addRow({std::to_string(counts[row].second), counts[row].first});
  }
  std::string text = "\n" + table.text(terminal);
  if (counts.size() > shown) {
    text += fmt::format("and {} more\n", counts.size() - shown);
  }
  return text;
}

std::string remarksText(const FleetSummary& summary) {
  struct Remark {
    std::size_t count;
    const char* wordsForOne;
    const char* words;
  };
  const Remark remarks[] = {
      {summary.warningCount(), "migrated with warnings", "migrated with warnings"},
      {summary.countOf(Remedy::Losses), "migrated, but not everything: --list losses --reasons",
       "migrated, but not everything: --list losses --reasons"},
      {summary.countOf(Remedy::Retry), "to run again: --list retry", "to run again: --list retry"},
      {summary.countOf(Remedy::Attention), "to look at before it is run again: --list attention",
       "to look at before they are run again: --list attention"},
      {summary.replacedCount(), "result replaced by a later one of the same image",
       "results replaced by later ones of the same image"},
      {summary.missingRoots().size(), "without a result: --list missing",
       "without a result: --list missing"},
      {summary.unreadableLineCount(), "line that is no result", "lines that are no results"},
  };
  std::string text;
  for (const Remark& remark : remarks) {
    if (remark.count > 0) {
      text += fmt::format("{}{} {}\n", text.empty() ? "\n" : "", remark.count,
                          remark.count == 1 ? remark.wordsForOne : remark.words);
    }
  }
  return text;
}

JSON jsonOf(const Counts<std::string>& counts, const char* key) {
  JSON list = JSON::array();
  for (const auto& [text, count] : counts) {
    list.push_back({{key, text}, {"images", count}});
  }
  return list;
}

std::string objectLine(const SummarizeOptions& options, const FleetSummary& summary,
                       ExitStatus exitStatus) {
  JSON outcomes = JSON::array();
  for (const auto& [status, count] : summary.exitStatuses()) {
    outcomes.push_back(
        {{"exitStatus", status}, {"outcome", outcomeOf(status).name}, {"images", count}});
  }
  JSON object = reportObject("summarize");
  object["images"] = summary.imageCount();
  object["expected"] = options.expected ? JSON(*options.expected) : JSON(nullptr);
  object["outcomes"] = std::move(outcomes);
  object["steps"] = jsonOf(summary.steps(), "step");
  object["errors"] = jsonOf(summary.errors(), "error");
  object["migratedWithWarnings"] = summary.warningCount();
  object["replacedResults"] = summary.replacedCount();
  object["unreadableLines"] = summary.unreadableLineCount();
  object["retry"] = summary.rootsWith(Remedy::Retry);
  object["attention"] = summary.rootsWith(Remedy::Attention);
  JSON losses = JSON::array();
  for (const RunResult* result : summary.resultsWith(Remedy::Losses)) {
    losses.push_back({{"root", *result->root}, {"losses", result->losses}});
  }
  object["losses"] = std::move(losses);
  object["missing"] = options.rootsFile ? JSON(summary.missingRoots()) : JSON(nullptr);
  return lineOf(std::move(object), exitStatus);
}

}  // namespace

CommandResult summarize(const SummarizeOptions& asked, const Terminal& terminal) {
  SummarizeOptions options = asked;
  FleetSummary summary;
  if (options.rootsFile) {
    const auto roots = readRoots(*options.rootsFile);
    if (const auto* error = std::get_if<ProgramError>(&roots)) {
      return *error;
    }
    summary.expect(std::get<std::vector<std::string>>(roots));
    options.expected = std::get<std::vector<std::string>>(roots).size();
  }
  {
    ProgressLine progress;
    for (const std::string& name : options.files) {
      for (const std::string& file : filesOf(name)) {
        if (std::optional<ProgramError> error = addFile(file, options, summary, progress)) {
          return *std::move(error);
        }
      }
    }
  }
  if (options.html) {
    std::error_code error;
    const std::filesystem::path page = std::filesystem::absolute(*options.html, error);
    const std::string directory = page.parent_path().lexically_normal().string();
    if (std::optional<ProgramError> problem =
            replaceFile(*options.html, fleetPage(summary, directory))) {
      return *std::move(problem);
    }
  }
  if (options.listed) {
    return CommandReport{listOf(*options.listed, options, summary, terminal), ExitStatus::Success};
  }
  const bool isDone = summary.countOf(Remedy::None) == summary.imageCount() &&
                      missingCount(options, summary) == 0 && summary.unreadableLineCount() == 0;
  const ExitStatus exitStatus = isDone ? ExitStatus::Success : ExitStatus::Attention;
  if (options.reportsJSON) {
    return CommandReport{objectLine(options, summary, exitStatus), exitStatus};
  }
  return CommandReport{outcomesText(options, summary, terminal) +
                           countsText("Step", summary.steps(), summary.steps().size(), terminal) +
                           countsText("Error", summary.errors(), kShownErrors, terminal) +
                           remarksText(summary),
                       exitStatus};
}

}  // namespace accounts
