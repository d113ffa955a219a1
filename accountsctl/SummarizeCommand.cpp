#include "accountsctl/SummarizeCommand.h"

#include <fcntl.h>
#include <fmt/format.h>
#include <unistd.h>

#include <algorithm>
#include <cerrno>
#include <filesystem>
#include <sstream>
#include <unordered_set>

#include "accountsctl/FleetPage.h"
#include "accountsctl/FleetSummary.h"
#include "accountsctl/JSONText.h"
#include "accountsctl/ProgressLine.h"
#include "accountsctl/TextTable.h"
#include "commandline/PlatformError.h"
#include "platform/linux/FileContents.h"
#include "propertylist/value/Description.h"

namespace accounts {
namespace {

/// People look for what is frequent; the JSON object has the others as well.
constexpr std::size_t kShownErrors = 10;

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

/// Adds every line of the file that the keeper reads aloud.
void addFile(const CommandWorker& worker, const SummarizedFile& file,
             const SummarizeOptions& options, FleetSummary& summary, ProgressLine& progress) {
  std::string text;
  const auto add = [&](std::string_view line) {
    summary.addLine(line, file.page);
    if (progress.wantsText()) {
      progress.show(progressText(summary, options.expected));
    }
  };
  for (std::string piece = worker.nextPiece(); !piece.empty(); piece = worker.nextPiece()) {
    std::size_t begin = 0;
    std::size_t searched = text.size();
    text += piece;
    for (std::size_t end = 0; (end = text.find('\n', searched)) != std::string::npos;
         begin = searched = end + 1) {
      add(std::string_view(text).substr(begin, end - begin));
    }
    text.erase(0, begin);
  }
  add(text);
}

/// The roots in a text, each once. Lines may end as on another system, and blank ones are none.
std::vector<std::string> rootsIn(const std::string& text) {
  std::vector<std::string> roots;
  std::unordered_set<std::string> known;
  std::istringstream lines(text);
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

/// What a file has; one that does not say counts as the largest.
std::uint64_t sizeOf(const SummarizedFile& file) {
  std::error_code error;
  const std::uintmax_t size = std::filesystem::file_size(file.name, error);
  return error ? kLargestFileSize : size;
}

OrProgramError<void> readAloud(const std::string& file, const TakePiece& take) {
  constexpr std::size_t kPiece = std::size_t{64} << 10;
  std::string piece(kPiece, '\0');
  const FileDescriptor opened(file == kStandardStream
                                  ? ::fcntl(STDIN_FILENO, F_DUPFD_CLOEXEC, 0)
                                  : ::open(file.c_str(), O_RDONLY | O_CLOEXEC | O_NOCTTY));
  for (;;) {
    const ssize_t count =
        opened.number() < 0 ? -1 : ::read(opened.number(), piece.data(), piece.size());
    if (count < 0 && errno == EINTR) {
      continue;
    }
    if (count < 0) {
      return programErrorOf(pathFailure("read", file, errno), ExitStatus::MissingInput);
    }
    const bool isHeard = take(std::string_view(piece).substr(0, static_cast<std::size_t>(count)));
    if (count == 0 || !isHeard) {
      return {};
    }
  }
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

std::vector<SummarizedFile> filesToSummarize(const SummarizeOptions& options) {
  std::vector<SummarizedFile> files;
  for (const std::string& name : options.files) {
    for (std::string& file : filesOf(name)) {
      std::optional<std::string> page = pageBeside(file);
      files.push_back({std::move(file), std::move(page)});
    }
  }
  return files;
}

OrProgramError<void> readAloud(const std::vector<SummarizedFile>& files, const TakePiece& take) {
  for (const SummarizedFile& file : files) {
    if (auto read = readAloud(file.name, take); !read) {
      return read;
    }
  }
  return {};
}

CommandResult summarize(const SummarizeOptions& asked, const std::vector<SummarizedFile>& files,
                        const Terminal& terminal, const CommandWorker& worker) {
  SummarizeOptions options = asked;
  OpenInputs inputs;
  for (const SummarizedFile& file : files) {
    inputs.size += sizeOf(file);
  }
  std::optional<std::string> rootsText;
  if (options.rootsFile) {
    auto read = readHostFile(*options.rootsFile);
    if (!read) {
      return programErrorOf(read.error(), ExitStatus::MissingInput);
    }
    rootsText = *std::move(read);
    inputs.size += rootsText->size();
  }
  std::error_code unknown;
  const std::filesystem::path page =
      std::filesystem::absolute(options.html.value_or(std::string()), unknown);
  FleetSummary summary;
  {
    ProgressLine progress;
    worker.giveUpRights(inputs);
    if (rootsText) {
      const std::vector<std::string> roots = rootsIn(*rootsText);
      summary.expect(roots);
      options.expected = roots.size();
    }
    for (const SummarizedFile& file : files) {
      addFile(worker, file, options, summary, progress);
    }
  }
  std::optional<std::string> written;
  if (options.html) {
    written = fleetPage(summary, page.parent_path().lexically_normal().string());
  }
  if (options.listed) {
    return CommandReport{listOf(*options.listed, options, summary, terminal)};
  }
  const bool isDone = summary.countOf(Remedy::None) == summary.imageCount() &&
                      missingCount(options, summary) == 0 && summary.unreadableLineCount() == 0;
  const ExitStatus exitStatus = isDone ? ExitStatus::Success : ExitStatus::Attention;
  if (options.reportsJSON) {
    return CommandReport{objectLine(options, summary, exitStatus), exitStatus, std::move(written)};
  }
  return CommandReport{outcomesText(options, summary, terminal) +
                           countsText("Step", summary.steps(), summary.steps().size(), terminal) +
                           countsText("Error", summary.errors(), kShownErrors, terminal) +
                           remarksText(summary),
                       exitStatus, std::move(written)};
}

}  // namespace accounts
