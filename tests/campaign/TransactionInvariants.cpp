#include "tests/campaign/TransactionInvariants.h"

#include <algorithm>
#include <array>

#include "safetynet/CommitRecord.h"
#include "tests/campaign/SettingsContents.h"
#include "tests/program/StoredVersionsComparison.h"
#include "vocabulary/AccountVocabulary.h"

namespace accounts {

namespace {

/// Whether the same inode with the same contents, or nothing, stands at a path of two disks.
bool isSameAt(const std::string& path, const SimulatedDisk& one, const SimulatedDisk& other) {
  const auto first = one.find(path);
  const auto second = other.find(path);
  return first.has_value() == second.has_value() &&
         (!first || (one.inode(*first).number == other.inode(*second).number &&
                     one.inode(*first).contents == other.inode(*second).contents &&
                     one.inode(*first).modified == other.inode(*second).modified &&
                     one.inode(*first).permissions == other.inode(*second).permissions &&
                     one.inode(*first).owner == other.inode(*second).owner &&
                     one.inode(*first).group == other.inode(*second).group));
}

FileTime fileTime(std::uint64_t nanoseconds) {
  constexpr std::uint64_t kSecond = 1'000'000'000;
  return {.seconds = static_cast<std::int64_t>(nanoseconds / kSecond),
          .nanoseconds = static_cast<std::int64_t>(nanoseconds % kSecond)};
}

/// Whether a commit record on a disk says that a store was carried over.
bool isVouchedFor(const SimulatedDisk& disk, DevicePlace store) {
  const auto text = disk.contentsOf(pathOf(DevicePlace::CommitRecord));
  const auto inode = disk.find(pathOf(store));
  return text && inode &&
         std::ranges::any_of(CommitRecord::parse(*text).stores, [&](const auto& each) {
           return each.place == store && each.store.size == disk.inode(*inode).contents.size() &&
                  each.store.modified == fileTime(disk.inode(*inode).modified);
         });
}

bool isIn(std::string_view path, std::string_view directory) {
  return path.starts_with(directory) && path.substr(directory.size()).starts_with('/');
}

/// Whether a path is one that a run may make or change: a place, a temporary file, or the host's
/// own.
bool mayChange(const std::string& path) {
  return isTemporary(path) || path == kAccountMigrationLockFilename ||
         isIn(path, kAccountMigrationDirectory) ||
         isIn(path, pathOf(DevicePlace::InformationDirectory)) ||
         std::ranges::any_of(kDevicePlaces,
                             [&](const ListedPlace& each) { return path == pathOf(each.place); });
}

/// The whole folders of files that are kept for a migration.
std::vector<std::string> keptFolders(const SimulatedDisk& disk) {
  std::vector<std::string> folders;
  if (const auto directory = disk.find(kAccountMigrationDirectory)) {
    for (const auto& [name, inode] : disk.inode(*directory).entries) {
      if (name.starts_with("Kept-")) {
        folders.push_back(std::string(kAccountMigrationDirectory) + "/" + name);
      }
    }
  }
  return folders;
}

}  // namespace

TransactionInvariants::TransactionInvariants(const Scenario& scenario)
    : scenario_(scenario),
      undisturbed_(runOn(scenario.disk, scenario, {.recording = SimulatedKernel::Recording::On})),
      textsBefore_(textsOn(scenario.disk)),
      writesSettings_(undisturbed_.succeeded && !undisturbed_.settingsWritten.empty()),
      ending_(endingOf(undisturbed_.disk, undisturbed_.exitStatus)) {
  ending_.settingsLater = ending_.settings;
}

Ending TransactionInvariants::endingAfterRun(const SimulatedDisk& disk) const {
  // What a run makes up must differ from what is on the disk.
  constexpr unsigned kLastRun = 9;
  const Run run = runOn(disk, scenario_, {.number = kLastRun});
  Ending ending = endingOf(run.disk, run.exitStatus);
  const Run later = runOn(run.disk, scenario_, {.number = kLastRun + 1});
  ending.settingsLater = endingOf(later.disk, later.exitStatus).settings;
  return ending;
}

bool TransactionInvariants::hasOldSettings(const SimulatedDisk& disk) const {
  return isSameAt(pathOf(DevicePlace::Settings), disk, scenario_.disk);
}

Complaint TransactionInvariants::ofOtherFiles(const SimulatedDisk& disk) const {
  std::vector<std::string> paths = disk.filesBeneath("/");
  const std::vector<std::string> before = scenario_.disk.filesBeneath("/");
  paths.insert(paths.end(), before.begin(), before.end());
  for (const std::string& path : paths) {
    if (!mayChange(path) && !isSameAt(path, disk, scenario_.disk)) {
      return path + " is none of a migration's business but changed";
    }
  }
  return std::nullopt;
}

Complaint TransactionInvariants::ofKeptFolders(const SimulatedDisk& disk, bool isMigrated) const {
  const std::vector<std::string> folders = keptFolders(disk);
  const std::vector<std::string> earlier = keptFolders(scenario_.disk);
  bool isKept = false;
  for (const std::string& folder : folders) {
    if (!disk.exists(folder + "/List")) {
      return folder + " has no list";
    }
    const bool isEarlier = std::ranges::find(earlier, folder) != earlier.end();
    bool isWhole = true;
    for (const DevicePlace place : {DevicePlace::Settings, DevicePlace::LegacyExchange,
                                    DevicePlace::LegacyMail, DevicePlace::CopyAside}) {
      const std::string kept = folder + "/" + std::string(listed(place).name);
      const std::string source = isEarlier ? kept : pathOf(place);
      isWhole = isWhole && disk.contentsOf(kept) == scenario_.disk.contentsOf(source);
    }
    // A second run keeps what it finds, which may be a migrated device.
    if (!isWhole && (isEarlier || hasOldSettings(disk))) {
      return folder + " does not hold what stood at the places";
    }
    isKept = isKept || (isWhole && !isEarlier);
  }
  if (!std::ranges::includes(folders, earlier)) {
    return "an earlier folder of kept files is gone";
  }
  const bool mustBeKept = keptFolders(undisturbed_.disk).size() > earlier.size();
  return isMigrated && writesSettings_ && mustBeKept && !isKept
             ? Complaint("the device is migrated and what it was is not kept")
             : Complaint();
}

Complaint TransactionInvariants::ofStores(const SimulatedDisk& disk, bool isMigrated) const {
  for (const LegacyStore& each : kLegacyStores) {
    const std::string path = pathOf(each.store);
    const bool stood = scenario_.disk.exists(path);
    if (stood && !disk.exists(path) && !isMigrated) {
      return path + " is gone although its accounts are not in the settings file";
    }
    if (disk.exists(path) && !isSameAt(path, disk, scenario_.disk)) {
      return path + " is not what it was";
    }
    const bool isToGo = stood && !undisturbed_.disk.exists(path);
    if (isToGo && disk.exists(path) && isMigrated && writesSettings_ &&
        !isVouchedFor(disk, each.store)) {
      return path + " would be converted a second time";
    }
  }
  return std::nullopt;
}

Complaint TransactionInvariants::ofBestEffort(const SimulatedDisk& disk) const {
  const std::string copy = pathOf(DevicePlace::CopyAside);
  if (!isSameAt(copy, disk, scenario_.disk) &&
      disk.contentsOf(copy) != scenario_.disk.contentsOf(pathOf(DevicePlace::Settings)) &&
      disk.contentsOf(copy) != disk.contentsOf(pathOf(DevicePlace::Settings))) {
    return "the copy aside is none of a settings file";
  }
  for (const std::string& path : disk.filesBeneath(pathOf(DevicePlace::InformationDirectory))) {
    if (!isTemporary(path) && path != pathOf(DevicePlace::InformationDirectory) &&
        !dictionaryIn(*disk.contentsOf(path))) {
      return "the migration-information file is not whole";
    }
  }
  return std::nullopt;
}

Complaint TransactionInvariants::ofInterruption(const SimulatedDisk& disk,
                                                const std::vector<std::string>& settingsWritten) {
  const auto settings = disk.contentsOf(pathOf(DevicePlace::Settings));
  const bool isOld = hasOldSettings(disk);
  if (!isOld &&
      (!settings || std::ranges::find(settingsWritten, *settings) == settingsWritten.end())) {
    return settings ? "the settings file is neither the old one nor a whole new one"
                    : "the settings file is gone";
  }
  const bool isMigrated = undisturbed_.succeeded && (!isOld || !writesSettings_);
  for (const Complaint& complaint : {ofStores(disk, isMigrated), ofBestEffort(disk),
                                     ofKeptFolders(disk, isMigrated), ofOtherFiles(disk)}) {
    if (complaint) {
      return complaint;
    }
  }
  const std::string sentinel = pathOf(DevicePlace::RemovalSentinel);
  return !isMigrated && disk.exists(sentinel) && !scenario_.disk.exists(sentinel)
             ? Complaint("the sentinel gives up the legacy stores before they are carried over")
             : Complaint();
}

Complaint TransactionInvariants::ofUnchanged(const SimulatedDisk& disk) const {
  for (const ListedPlace& each : kDevicePlaces) {
    // A record that could not be taken away again says nothing wrong of a device that is as it was.
    const bool isContainer = each.place == DevicePlace::InformationDirectory;
    if (each.place != DevicePlace::CommitRecord && !isContainer &&
        !isSameAt(pathOf(each.place), disk, scenario_.disk)) {
      return "the run failed but changed " + pathOf(each.place);
    }
  }
  if (disk.filesBeneath(pathOf(DevicePlace::InformationDirectory)) !=
      scenario_.disk.filesBeneath(pathOf(DevicePlace::InformationDirectory))) {
    return "the run failed but left information";
  }
  return ofOtherFiles(disk);
}

bool TransactionInvariants::isFitting(const Run& run) const {
  if (run.exitStatus == undisturbed_.exitStatus) {
    return true;
  }
  // Without a lock the plug-in says for itself that it cannot migrate.
  const bool isOfLock = std::ranges::any_of(run.refusedPaths, [](const std::string& path) {
    return path == kAccountMigrationLockFilename || isIn(kAccountMigrationLockFilename, path);
  });
  static constexpr std::array kStatusesOfFaults = {
      ExitStatus::NotVerified, ExitStatus::MissingInput, ExitStatus::CannotCreate,
      ExitStatus::InputOutputError, ExitStatus::TemporaryFailure};
  return run.exitStatus == ExitStatus::MigrationFailed
             ? isOfLock
             : !run.error.empty() &&
                   std::ranges::find(kStatusesOfFaults, run.exitStatus) != kStatusesOfFaults.end();
}

Complaint TransactionInvariants::ofFaultedRun(const Run& run, const Fault& fault) {
  if (run.openDescriptors != 0) {
    return "a descriptor stayed open";
  }
  if (const Complaint complaint = ofInterruption(run.disk, run.settingsWritten)) {
    return complaint;
  }
  if (!run.succeeded) {
    if (!isFitting(run)) {
      return "a fault ended the run with exit status " +
             std::to_string(static_cast<int>(run.exitStatus)) + ": " + run.error;
    }
    if (const Complaint complaint = ofUnchanged(run.disk)) {
      return complaint;
    }
  } else if (hasOldSettings(run.disk) && writesSettings_) {
    return "the run says that it is committed, and the settings file is the old one";
  }
  if (fault.duration != Fault::Duration::Once || fault.error == 0) {
    return std::nullopt;
  }
  // What a single fault leaves behind has a line of its own.
  const Ending ending = endingOf(run.disk, run.exitStatus);
  if (run.succeeded && ending.places != ending_.places && run.warnings.empty()) {
    return "something was not done, and no warning says so";
  }
  return std::nullopt;
}

Complaint TransactionInvariants::ofNextRun(const SimulatedDisk& disk, const Ending& expected) {
  const std::pair key(disk.fingerprint(), &expected);
  const auto known = nextRuns_.find(key);
  return known != nextRuns_.end()
             ? known->second
             : nextRuns_.emplace(key, judgeNextRun(disk, expected)).first->second;
}

Complaint TransactionInvariants::judgeNextRun(const SimulatedDisk& disk,
                                              const Ending& expected) const {
  const Run run = runOn(disk, scenario_, {.number = 2});
  if (const Complaint difference = differenceOf(expected, endingOf(run.disk, run.exitStatus))) {
    return "the next run ends otherwise than it should: " + *difference + " " + run.error;
  }
  if (!temporaryFiles(run.disk).empty()) {
    return "the next run leaves a temporary file";
  }
  for (const std::string& path : run.disk.filesBeneath(kAccountMigrationDirectory)) {
    if (path.find("/Unfinished-") != std::string::npos) {
      return "the next run leaves an unfinished folder";
    }
  }
  // Kept on purpose: a legacy account converted again, over a file in which it has become a child
  // by now, is merged with that child's parent. Two accounts of one identifier differ from save to
  // save.
  const auto settings = run.disk.contentsOf(pathOf(DevicePlace::Settings));
  if (settings && hasDuplicates(dictionaryIn(*settings).value_or(PropertyDictionary()))) {
    return std::nullopt;
  }
  const Run third = runOn(run.disk, scenario_, {.number = 3});
  return third.disk.contentsOf(pathOf(DevicePlace::Settings)) == settings
             ? Complaint()
             : "a run with nothing to do changes the file";
}

}  // namespace accounts
