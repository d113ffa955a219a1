#include "safetynet/Restoration.h"

#include <utility>
#include <variant>

#include "safetynet/KeptFolders.h"
#include "safetynet/PutBack.h"

namespace accounts {
namespace {

ProgramError missing(std::string message) {
  return ProgramError{ExitStatus::MissingInput, std::move(message)};
}

std::variant<std::string, ProgramError> chosenFolder(const KeptFolders& folders,
                                                     const std::optional<std::string>& asked) {
  if (asked) {
    const std::string name(nameOf(*asked));
    const bool isElsewhere = *asked != name && *asked != KeptFolders::pathOf(name);
    if (isElsewhere || !folders.contains(name)) {
      return missing("No folder of kept files: " + *asked);
    }
    return KeptFolders::pathOf(name);
  }
  const std::vector<std::string> kept = folders.ofMigrations();
  if (kept.empty()) {
    return missing("No files are kept in " + std::string(kAccountMigrationDirectory));
  }
  if (kept.size() > 1) {
    std::string message = "Several folders hold kept files, --from must name one:";
    for (const std::string& folder : kept) {
      message.append(" ").append(nameOf(folder));
    }
    return ProgramError{ExitStatus::UnusableArguments, std::move(message)};
  }
  return kept.front();
}

std::variant<std::vector<std::string>, ProgramError> filesIn(FileSystem& files,
                                                             const AccountFiles& accountFiles,
                                                             const std::string& folder) {
  std::vector<std::string> held;
  for (const std::string& path : accountFiles.inputs()) {
    const std::optional<EntryKind> kind = files.kindOfEntry(keptPath(folder, path));
    if (kind == EntryKind::RegularFile) {
      held.push_back(path);
    } else if (kind != EntryKind::Nothing) {
      return missing(keptPath(folder, path) + " is no regular file");
    }
  }
  if (held.empty()) {
    return missing("No kept files in " + folder);
  }
  return held;
}

/// Keeps the files that are about to be replaced.
std::optional<ProgramError> keepReplaced(FileSystem& files, KeptFolders& folders,
                                         Restoration& restoration,
                                         const std::vector<std::string>& paths,
                                         std::string_view time) {
  std::vector<std::string> replaced;
  for (const std::string& path : paths) {
    const std::optional<EntryKind> kind = files.kindOfEntry(path);
    if (kind == EntryKind::RegularFile) {
      if (!files.haveSameContents(keptPath(*restoration.folder, path), path)) {
        replaced.push_back(path);
      }
    } else if (kind != EntryKind::Nothing) {
      return ProgramError{ExitStatus::CannotCreate,
                          path + " is no regular file, so it is not replaced"};
    }
  }
  if (replaced.empty()) {
    return std::nullopt;
  }
  std::string folder;
  if (const Result kept = folders.keep(replaced, KeptFor::Restoration, time, folder); !kept) {
    return ProgramError{ExitStatus::CannotCreate,
                        "What would be replaced cannot be kept: " + kept.error()};
  }
  restoration.replaced = std::move(folder);
  return std::nullopt;
}

Result putAllBack(FileSystem& files, const AccountFiles& accountFiles, Restoration& restoration,
                  const std::vector<std::string>& paths) {
  // A sentinel would have the next migration remove the legacy stores without converting them.
  Result result = removeDurably(files, accountFiles.removalSentinel);
  for (const std::string& path : paths) {
    if (result) {
      result = putBack(files, *restoration.folder, path);
    }
    if (result) {
      restoration.restored.push_back(path);
    }
  }
  return result;
}

}  // namespace

Restoration restoreKeptFiles(FileSystem& files, const AccountFiles& accountFiles,
                             const std::optional<std::string>& folder, std::string_view time) {
  Restoration restoration;
  KeptFolders folders(files);
  auto chosen = chosenFolder(folders, folder);
  if (auto* error = std::get_if<ProgramError>(&chosen)) {
    restoration.error = std::move(*error);
    return restoration;
  }
  restoration.folder = std::get<std::string>(std::move(chosen));
  auto held = filesIn(files, accountFiles, *restoration.folder);
  if (auto* error = std::get_if<ProgramError>(&held)) {
    restoration.error = std::move(*error);
    return restoration;
  }
  const auto& paths = std::get<std::vector<std::string>>(held);
  folders.removeUnfinished();
  removePutBackLeftovers(files, accountFiles);
  restoration.error = keepReplaced(files, folders, restoration, paths, time);
  if (restoration.error) {
    return restoration;
  }
  if (const Result back = putAllBack(files, accountFiles, restoration, paths); !back) {
    restoration.error = ProgramError{ExitStatus::InputOutputError,
                                     "Not everything could be put back, " + *restoration.folder +
                                         " is still whole: " + back.error()};
  } else if (const Result discarded = folders.discard(*restoration.folder); !discarded) {
    restoration.error = ProgramError{
        ExitStatus::InputOutputError,
        "Everything is put back, but the folder cannot be removed: " + discarded.error()};
  }
  return restoration;
}

}  // namespace accounts
