#include "accountsctl/DeviceStatus.h"

#include <fcntl.h>
#include <sys/file.h>

#include "accountsctl/PlatformInMemory.h"
#include "accountsettings/AccountsManager.h"
#include "migrator/AccountsDataMigrator.h"
#include "platform/linux/DictionaryFile.h"
#include "platform/linux/LinuxDevicePlaces.h"
#include "platform/linux/TemporaryFile.h"
#include "safetynet/KeptFolders.h"
#include "vocabulary/DevicePath.h"

namespace accounts {
namespace {

/// Where in the home directory a migration has temporary files.
constexpr std::string_view kTemporaryPlaces[] = {"tmp", "Library/Preferences",
                                                 "Library/Logs/CrashReporter/AccountMigration"};

void lookAtSettings(Transaction& transaction, DeviceStatus& status) {
  const PlaceState& place = transaction.snapshot().at(DevicePlace::Settings);
  status.settingsPath = place.path;
  status.hasSettings = transaction.exists(DevicePlace::Settings);
  const std::optional<std::string> bytes = transaction.bytesBefore(DevicePlace::Settings);
  const auto root = bytes ? dictionaryFromBytes(*bytes, place.path) : Failure();
  if (!root) {
    const auto& whyNotRead = place.whyNotRead ? place.whyNotRead : transaction.readFailure();
    status.settingsProblem = !status.hasSettings ? std::nullopt
                             : whyNotRead        ? std::optional(whyNotRead->text)
                                                 : std::optional(root.error().text);
    return;
  }
  if (const PropertyValue* version = root->find(kPlistVersionKey)) {
    status.storedVersion = *version;
  }
  status.accountCount = root->arrayForKey(kPlistAccountsKey).value_or(PropertyArray()).size();
}

/// Asks the migration's own decisions.
void lookAtWork(DeviceStatus& status) {
  status.finishesRemoval = AccountsDataMigrator()._failedToRemoveOldAccountsInfo();
  if (status.finishesRemoval) {
    return;
  }
  bool isOutOfDate = false;
  AccountsManager::shouldMigrateOldMailAccounts_oldDAAccounts_newAccountSettings(
      &status.convertsMailAccounts, &status.convertsExchangeAccounts, &isOutOfDate);
  // Converted accounts go through the chain as well, from the version of the file.
  const auto version = static_cast<std::uint64_t>(
      status.storedVersion ? status.storedVersion->integerValue().value_or(0) : 0);
  const bool runsChain =
      isOutOfDate || status.convertsMailAccounts || status.convertsExchangeAccounts;
  if (runsChain && version < AccountsManager::currentVersion()) {
    status.upgradesFromVersion = version;
  }
}

/// The paths in a directory whose names begin in a way, in order.
std::vector<std::string> pathsWithPrefix(LinuxPlatform& platform, std::string_view directory,
                                         std::string_view prefix) {
  std::vector<std::string> paths;
  const auto names = platform.fileSystem().directoryEntries(directory);
  for (const std::string& name : names.value_or(std::vector<std::string>())) {
    if (name.starts_with(prefix)) {
      paths.push_back(joinedPath(directory, name));
    }
  }
  return paths;
}

/// Whether no process has a temporary file in its hands. The lock that tells is given back at once.
bool isAbandoned(const DeviceRoot& root, const std::string& path) {
  const auto entry = root.locate(path);
  const auto file = entry ? entry->openRegularFile(O_RDONLY) : entry.error();
  return file && ::flock(file->number(), LOCK_SH | LOCK_NB) == 0;
}

}  // namespace

OrFailure<DeviceStatus> leftoversOn(LinuxPlatform& platform) {
  const std::string home = platform.platform().homeDirectory.path();
  LinuxDevicePlaces places(platform.root(), platform.fileSystem(), home);
  auto kept = KeptFolders(platform.fileSystem(), places).keptFor(KeptFor::Migration);
  if (!kept) {
    return kept.error();
  }
  DeviceStatus status;
  status.keptFolders = *std::move(kept);
  for (const std::string_view place : kTemporaryPlaces) {
    for (std::string& path :
         pathsWithPrefix(platform, joinedPath(home, place), kTemporaryFilePrefix)) {
      if (isAbandoned(platform.root(), path)) {
        status.abandonedFiles.push_back(std::move(path));
      }
    }
  }
  return status;
}

void lookAtDevice(LinuxPlatform& platform, const DeviceSnapshot& snapshot, DeviceStatus& status) {
  Transaction transaction(snapshot, platform.platform().homeDirectory.path());
  const PlatformInMemory inMemory(platform, transaction, nullptr);
  lookAtSettings(transaction, status);
  lookAtWork(status);
}

}  // namespace accounts
