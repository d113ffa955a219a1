#include "safetynet/KeptFolders.h"

#include <algorithm>
#include <array>
#include <utility>

#include "safetynet/PlaceErrors.h"

namespace accounts {
namespace {

constexpr std::string_view kMigrationPrefix = "Kept-";
constexpr std::string_view kRestorationPrefix = "Replaced-";
constexpr std::string_view kUnfinishedPrefix = "Unfinished-";
constexpr std::array kAllPrefixes = {kMigrationPrefix, kRestorationPrefix, kUnfinishedPrefix};

/// The list of what stood where: why it was kept, and a line for each place: what, a tab, the name
/// of the place.
constexpr std::string_view kList = "List";
constexpr std::size_t kLongestList = 4096;

struct KindName {
  EntryKind kind;
  std::string_view name;
};
constexpr KindName kKindNames[] = {{EntryKind::Nothing, "nothing"},
                                   {EntryKind::RegularFile, "file"},
                                   {EntryKind::Directory, "directory"},
                                   {EntryKind::Other, "other"}};

struct ReasonLine {
  KeptFor reason;
  std::string_view line;
};
constexpr ReasonLine kReasonLines[] = {{KeptFor::Migration, "kept on request\n"},
                                       {KeptFor::MigrationWithLosses, "kept for losses\n"},
                                       {KeptFor::Restoration, "kept by a restoration\n"}};

constexpr unsigned kDirectoryPermissions = 0755;
constexpr unsigned kOwnerOnly = 0700;

// Hosts on one root take turns, so that hardly ever two folders are made in one second.
constexpr int kMostFoldersOfOneTime = 1000;

std::string inDirectory(std::string_view directory, std::string_view name) {
  return std::string(directory).append("/").append(name);
}

std::string_view directoryOf(std::string_view path) {
  return path.substr(0, path.rfind('/'));
}

std::string_view nameOf(std::string_view path) {
  return path.substr(path.rfind('/') + 1);
}

std::string prefixed(std::string_view prefix, std::string_view suffix) {
  return inDirectory(kAccountMigrationDirectory, std::string(prefix).append(suffix));
}

std::string_view prefixOf(KeptFor purpose) {
  return purpose == KeptFor::Restoration ? kRestorationPrefix : kMigrationPrefix;
}

PlaceOutcome outcomeOf(const Result& result) {
  return result ? PlaceOutcome::done() : PlaceOutcome::failed(result.error());
}

/// The time, made unique by a number where folders of that time exist; none when that cannot be
/// told.
std::optional<std::string> freeSuffix(FileKeeping& files, std::string_view time) {
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

std::string listText(KeptFor purpose, const std::vector<PlaceToKeep>& places) {
  std::string text(std::ranges::find(kReasonLines, purpose, &ReasonLine::reason)->line);
  for (const PlaceToKeep& each : places) {
    const auto* const kind = std::ranges::find(kKindNames, each.identity.kind, &KindName::kind);
    text.append(kind->name).append("\t").append(listed(each.place).name).append("\n");
  }
  return text;
}

std::optional<KeptList> listIn(std::string_view rest) {
  KeptList list;
  const auto* const reason = std::ranges::find_if(
      kReasonLines, [rest](const ReasonLine& each) { return rest.starts_with(each.line); });
  if (reason != std::end(kReasonLines)) {
    list.reason = reason->reason;
    rest.remove_prefix(reason->line.size());
  }
  while (!rest.empty()) {
    const std::string_view line = rest.substr(0, rest.find('\n'));
    const std::size_t tab = line.find('\t');
    const auto* const kind = std::ranges::find(kKindNames, line.substr(0, tab), &KindName::name);
    const auto place =
        tab != std::string_view::npos ? placeNamed(line.substr(tab + 1)) : std::nullopt;
    if (line.size() == rest.size() || kind == std::end(kKindNames) || !place ||
        !list.places.emplace(*place, kind->kind).second) {
      return std::nullopt;
    }
    rest.remove_prefix(line.size() + 1);
  }
  return list;
}

}  // namespace

OrFailure<std::vector<std::string>> KeptFolders::keptFor(KeptFor purpose) const {
  const auto names = files_.directoryEntries(kAccountMigrationDirectory);
  std::vector<std::string> folders;
  if (!names && !names.error().isMissing()) {
    return names.error();
  }
  for (const std::string& name : names ? *names : std::vector<std::string>()) {
    const auto isKept = name.starts_with(prefixOf(purpose)) ? contains(name) : false;
    if (!isKept) {
      return isKept.error();
    }
    if (*isKept) {
      folders.push_back(pathOf(name));
    }
  }
  return folders;
}

OrFailure<bool> KeptFolders::contains(std::string_view name) const {
  const bool isNameOfOne =
      (name.starts_with(kMigrationPrefix) || name.starts_with(kRestorationPrefix)) &&
      name.find('/') == std::string_view::npos;
  if (!isNameOfOne) {
    return false;
  }
  const auto kind = files_.kindOfEntry(pathOf(name));
  return kind ? OrFailure<bool>(*kind == EntryKind::Directory) : kind.error();
}

std::string KeptFolders::pathOf(std::string_view name) {
  return inDirectory(kAccountMigrationDirectory, name);
}

std::string KeptFolders::pathIn(std::string_view folder, DevicePlace place) {
  return inDirectory(folder, listed(place).name);
}

OrFailure<std::optional<KeptList>> KeptFolders::listOf(std::string_view folder) const {
  const auto contents = files_.shortContents(inDirectory(folder, kList), kLongestList);
  if (contents) {
    return listIn(*contents);
  }
  if (contents.error().kind() == FailureKind::Lasting) {
    return std::nullopt;
  }
  return contents.error();
}

PlaceOutcome KeptFolders::keep(const std::vector<PlaceToKeep>& places, KeptFor purpose,
                               std::string_view time, std::string& folder) {
  if (const Result made = makeDirectory(); !made) {
    return outcomeOf(made);
  }
  const std::optional<std::string> suffix = freeSuffix(files_, time);
  if (!suffix) {
    return outcomeOf(
        Failure{.text = "No name is free in " + std::string(kAccountMigrationDirectory)});
  }
  const std::string unfinished = prefixed(kUnfinishedPrefix, *suffix);
  const std::string finished = prefixed(prefixOf(purpose), *suffix);
  PlaceOutcome outcome = fill(unfinished, purpose, places);
  if (outcome.isDone()) {
    outcome = outcomeOf(files_.renameDirectory(unfinished, finished));
  }
  if (!outcome.isDone()) {
    removeWithContents(unfinished);
    // Renamed all the same when only the flush after that failed.
    if (files_.kindOfEntry(finished) == EntryKind::Directory) {
      (void)discard(finished);
    }
    removeDirectoryIfMade();
    return outcome;
  }
  folder = finished;
  return outcome;
}

Result KeptFolders::makeDirectory() {
  Result result;
  if (files_.kindOfEntry(kAccountMigrationDirectory) != EntryKind::Directory) {
    result =
        files_.createDirectoryWithIntermediates(kAccountMigrationDirectory, kDirectoryPermissions);
    madeDirectory_ = static_cast<bool>(result);
  }
  // Each of its parents may be a new name too, also where it was made by a run that was killed.
  for (std::string_view parent = directoryOf(kAccountMigrationDirectory); result && !parent.empty();
       parent = directoryOf(parent)) {
    result = files_.synchronizeDirectory(parent);
  }
  return result;
}

void KeptFolders::removeDirectoryIfMade() {
  if (madeDirectory_) {
    // Fails while there is anything else in it.
    (void)files_.removeDirectory(kAccountMigrationDirectory);
  }
}

PlaceOutcome KeptFolders::fill(const std::string& unfinished, KeptFor purpose,
                               const std::vector<PlaceToKeep>& places) {
  PlaceOutcome outcome = outcomeOf(files_.createDirectoryWithIntermediates(unfinished, kOwnerOnly));
  for (const PlaceToKeep& each : places) {
    const bool isKept =
        each.identity.kind == EntryKind::RegularFile || each.identity.kind == EntryKind::Other;
    if (outcome.isDone() && isKept) {
      outcome = places_.keep(each.place, pathIn(unfinished, each.place), each.identity);
    }
  }
  if (outcome.isDone()) {
    outcome =
        outcomeOf(files_.createFile(inDirectory(unfinished, kList), listText(purpose, places)));
  }
  return outcome.isDone() ? outcomeOf(files_.synchronizeDirectory(unfinished)) : outcome;
}

Result KeptFolders::discard(std::string_view folder) {
  const std::string_view name = nameOf(folder);
  const std::string unfinished = prefixed(kUnfinishedPrefix, name.substr(name.find('-') + 1));
  const Result renamed = files_.renameDirectory(folder, unfinished);
  if (renamed || files_.kindOfEntry(folder) == EntryKind::Nothing) {
    removeWithContents(unfinished);
    removeDirectoryIfMade();
    return {};
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
    (void)files_.removeFile(inDirectory(folder, name));
  }
  (void)files_.removeDirectory(folder);
}

}  // namespace accounts
