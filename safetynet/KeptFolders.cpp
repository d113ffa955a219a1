#include "safetynet/KeptFolders.h"

#include <algorithm>
#include <array>
#include <optional>

#include "safetynet/AccountFiles.h"

namespace accounts {
namespace {

constexpr std::string_view kMigrationPrefix = "Kept-";
constexpr std::string_view kRestorationPrefix = "Replaced-";
constexpr std::string_view kUnfinishedPrefix = "Unfinished-";
constexpr std::array kAllPrefixes = {kMigrationPrefix, kRestorationPrefix, kUnfinishedPrefix};

constexpr unsigned kDirectoryPermissions = 0755;
constexpr unsigned kOwnerOnly = 0700;

// Hosts on one root take turns, so that hardly ever two folders are made in one second.
constexpr int kMostFoldersOfOneTime = 1000;

std::string prefixed(std::string_view prefix, std::string_view suffix) {
  return pathIn(kAccountMigrationDirectory, std::string(prefix).append(suffix));
}

std::string_view prefixOf(KeptFor purpose) {
  return purpose == KeptFor::Migration ? kMigrationPrefix : kRestorationPrefix;
}

/// The time, made unique by a number where folders of that time exist; none when that cannot be
/// told.
std::optional<std::string> freeSuffix(FileSystem& files, std::string_view time) {
  for (int number = 1; number <= kMostFoldersOfOneTime; ++number) {
    std::string suffix(time);
    if (number > 1) {
      suffix += "-" + std::to_string(number);
    }
    if (std::ranges::all_of(kAllPrefixes, [&](std::string_view prefix) {
          return files.kindOfEntry(prefixed(prefix, suffix)) == EntryKind::Nothing;
        })) {
      return suffix;
    }
  }
  return std::nullopt;
}

}  // namespace

std::vector<std::string> KeptFolders::ofMigrations() const {
  std::vector<std::string> folders;
  for (const std::string& name :
       files_.directoryEntries(kAccountMigrationDirectory).value_or(std::vector<std::string>())) {
    if (name.starts_with(kMigrationPrefix) && contains(name)) {
      folders.push_back(pathOf(name));
    }
  }
  return folders;
}

bool KeptFolders::contains(std::string_view name) const {
  return (name.starts_with(kMigrationPrefix) || name.starts_with(kRestorationPrefix)) &&
         name.find('/') == std::string_view::npos &&
         files_.kindOfEntry(pathOf(name)) == EntryKind::Directory;
}

std::string KeptFolders::pathOf(std::string_view name) {
  return pathIn(kAccountMigrationDirectory, name);
}

Result KeptFolders::keep(const std::vector<std::string>& paths, KeptFor purpose,
                         std::string_view time, std::string& folder) {
  if (const Result made = makeDirectory(); !made) {
    return made;
  }
  const std::optional<std::string> suffix = freeSuffix(files_, time);
  if (!suffix) {
    return Result::failure("No name is free in " + std::string(kAccountMigrationDirectory));
  }
  const std::string unfinished = prefixed(kUnfinishedPrefix, *suffix);
  const std::string finished = prefixed(prefixOf(purpose), *suffix);
  Result result = fill(unfinished, paths);
  if (result) {
    result = files_.renameDirectory(unfinished, finished);
  }
  if (!result) {
    removeWithContents(unfinished);
    // Renamed all the same when only the flush after that failed.
    if (files_.kindOfEntry(finished) == EntryKind::Directory) {
      (void)discard(finished);
    }
    return result;
  }
  folder = finished;
  return result;
}

Result KeptFolders::makeDirectory() {
  if (files_.isDirectory(kAccountMigrationDirectory)) {
    return Result::success();
  }
  madeDirectory_ = true;
  Result result =
      files_.createDirectoryWithIntermediates(kAccountMigrationDirectory, kDirectoryPermissions);
  // Each of its parents may be a new name too.
  for (std::string_view parent = directoryOf(kAccountMigrationDirectory); result && !parent.empty();
       parent = directoryOf(parent)) {
    result = files_.synchronizeDirectory(parent);
  }
  return result;
}

Result KeptFolders::fill(const std::string& unfinished, const std::vector<std::string>& paths) {
  Result result = files_.createDirectoryWithIntermediates(unfinished, kOwnerOnly);
  for (const std::string& path : paths) {
    if (!result) {
      return result;
    }
    result = files_.linkFile(path, pathIn(unfinished, nameOf(path)));
  }
  return result ? files_.synchronizeDirectory(unfinished) : result;
}

Result KeptFolders::discard(std::string_view folder) {
  const std::string_view name = nameOf(folder);
  const std::string unfinished = prefixed(kUnfinishedPrefix, name.substr(name.find('-') + 1));
  const Result renamed = files_.renameDirectory(folder, unfinished);
  if (renamed || files_.kindOfEntry(folder) == EntryKind::Nothing) {
    removeWithContents(unfinished);
    return Result::success();
  }
  return renamed;
}

void KeptFolders::removeUnfinished() {
  for (const std::string& name :
       files_.directoryEntries(kAccountMigrationDirectory).value_or(std::vector<std::string>())) {
    if (name.starts_with(kUnfinishedPrefix) &&
        files_.kindOfEntry(pathOf(name)) == EntryKind::Directory) {
      removeWithContents(pathOf(name));
    }
  }
}

void KeptFolders::removeWithContents(const std::string& folder) {
  for (const std::string& name :
       files_.directoryEntries(folder).value_or(std::vector<std::string>())) {
    (void)files_.removeFile(pathIn(folder, name));
  }
  (void)files_.removeDirectory(folder);
  if (madeDirectory_) {
    // Fails while there is anything else in it.
    (void)files_.removeDirectory(kAccountMigrationDirectory);
  }
}

}  // namespace accounts
