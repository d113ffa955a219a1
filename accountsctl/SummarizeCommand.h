#pragma once

#include <cstddef>
#include <optional>
#include <string>
#include <vector>

#include "accountsctl/CommandResult.h"
#include "accountsctl/CommandWorker.h"
#include "accountsctl/RunResult.h"
#include "commandline/Terminal.h"

namespace accounts {

/// Images that can be listed: with a result that has a remedy, or without a result.
struct ListedImages {
  /// None: those without a result.
  std::optional<Remedy> remedy;
};

struct SummarizeOptions {
  /// Files with the lines that runs wrote, directories whose files *.json are such, "-" for
  /// standard input; not empty.
  std::vector<std::string> files;
  /// How many images there are; none if that is not known.
  std::optional<std::size_t> expected;
  /// A file of this machine with the roots of all images, one a line, blank lines apart; "-" for
  /// standard input, none if the images are not known.
  std::optional<std::string> rootsFile;
  /// A file of this machine that gets a page over all images; none for no page.
  std::optional<std::string> html;
  /// Gives the roots of these images in the place of the summary.
  std::optional<ListedImages> listed;
  /// Whether each listed root is followed by the reason.
  bool withReasons = false;
  /// Whether listed roots end with a null character rather than with the line.
  bool endsWithNull = false;
  bool reportsJSON = false;
};

/// A file with lines that runs wrote.
struct SummarizedFile {
  std::string name;
  /// The page of the report that it is; none for no such page.
  std::optional<std::string> page;
};

/// The files that are asked for, those in directories, too.
std::vector<SummarizedFile> filesToSummarize(const SummarizeOptions& options);

/// Reads them to the worker that summarizes them. An error when one cannot be read.
OrProgramError<void> readAloud(const std::vector<SummarizedFile>& files, const TakePiece& take);

/// Counts what runs of migration-host on many images reported: by outcome, stage and error. While
/// it reads, a terminal at standard error shows how far the fleet has come. The exit status of the
/// report is ExitStatus::Attention unless every image is migrated; that of a list is success.
CommandResult summarize(const SummarizeOptions& asked, const std::vector<SummarizedFile>& files,
                        const Terminal& terminal, const CommandWorker& worker);

}  // namespace accounts
