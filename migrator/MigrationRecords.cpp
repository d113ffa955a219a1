#include "accountsettings/Log.h"
#include "accountsettings/Process.h"
#include "migrator/AccountsDataMigrator.h"
#include "vocabulary/DevicePath.h"
#include "vocabulary/DevicePlaces.h"
#include "vocabulary/LegacyStoreKeys.h"

namespace accounts {

namespace {

constexpr std::string_view kRemovalOperation =
    "-[AccountsDataMigrator(Internal) _removeOldAccountsInfo]";
constexpr std::string_view kSaveInformationPreference = "ASSaveMigrationInformation";
constexpr unsigned kInformationDirectoryPermissions = 0777;

// Kept on purpose: the second "M" and the "S" give the month again and tenths of a second where
// minutes and seconds were meant. Tools that collect these files know the names as they are.
constexpr std::string_view kInformationDatePattern = "Y-M-d-H-M-S";

std::string pathInHomeDirectory(DevicePlace place) {
  return pathOfPlace(place, Process::current().platform.homeDirectory.path());
}

std::string informationDirectory() {
  return pathInHomeDirectory(DevicePlace::InformationDirectory);
}

void logRemovalFailure(const std::string& path, const Result& removal) {
  logToConsole("%s. Could not delete %@. Error = %@",
               {kRemovalOperation, path, removal.error().text});
}

/// Sees to it that the directory of migration-information files exists. False, with a console line,
/// when it does not.
bool makeInformationDirectory(FileSystem& files, const std::string& directory) {
  if (!files.fileExists(directory)) {
    const Result creation =
        files.createDirectoryWithIntermediates(directory, kInformationDirectoryPermissions);
    if (!creation) {
      logToConsole(
          "AccountMigration warning: Could not create the directory to store migration information "
          "at %@ [Error = %@]",
          {directory, creation.error().text});
    }
    return static_cast<bool>(creation);
  }
  if (!files.isDirectory(directory)) {
    // Kept on purpose: this line begins with "AccountMigrator", the one above with
    // "AccountMigration"; searches of device logs rely on both.
    logToConsole("AccountMigrator warning: %@ already exists and is not a directory", {directory});
    return false;
  }
  return true;
}

}  // namespace

void AccountsDataMigrator::_copyAsideAccountsPlist() {
  Platform& platform = Process::current().platform;
  const std::string source = AccountsManager::fullPathToAccountSettingsPlist();
  const std::string directory =
      joinedPath(platform.sharedResources.sharedResourcesDirectory(), "Library/Logs/CrashReporter");
  const std::string destination = joinedPath(directory, splitPath(source).name);

  if (platform.fileSystem.fileExists(destination) && !platform.fileSystem.removeFile(destination)) {
    logToConsole("Couldn't remove existing accountsettings copy at %@", {destination});
  }
  const Result copy = platform.fileSystem.copyFile(source, destination);
  if (!copy) {
    logToConsole("Error trying to save an accountsettings plist copy: %@", {copy.error().text});
  }
}

bool AccountsDataMigrator::_saveMigrationInformation() {
  Process& process = Process::current();
  return process.savesMigrationInformation.get([&process] {
    PreferenceDomain& preferences = process.platform.preferenceDomain;
    preferences.synchronize(kLoggingPreferences);
    const std::optional<PropertyValue> value =
        preferences.copyValue(kSaveInformationPreference, kLoggingPreferences);
    return value && value->booleanValue().value_or(false);
  });
}

void AccountsDataMigrator::collect(std::string_view key,
                                   const std::optional<PropertyDictionary>& contents) {
  if (_saveMigrationInformation() && _collatedMigrationData) {
    _collatedMigrationData->set(key, contents.value_or(PropertyDictionary()));
  }
}

std::string AccountsDataMigrator::_absolutePathToOldAccountsInfoRemovalSentinel() {
  return pathInHomeDirectory(DevicePlace::RemovalSentinel);
}

bool AccountsDataMigrator::_failedToRemoveOldAccountsInfo() {
  return Process::current().platform.fileSystem.fileExists(
      _absolutePathToOldAccountsInfoRemovalSentinel());
}

bool AccountsDataMigrator::_removeOldAccountsInfo() {
  FileSystem& files = Process::current().platform.fileSystem;
  const std::string sentinel = _absolutePathToOldAccountsInfoRemovalSentinel();
  if (!files.fileExists(sentinel)) {
    // Without the sentinel the removal is merely not protected against an interruption.
    static_cast<void>(files.createFile(sentinel, kRemovalSentinelContents));
  }

  const std::string exchangePath = daAccountPath();
  const Result exchangeRemoval = files.removeFile(exchangePath);
  const bool foundExchangeFileStays = !exchangeRemoval && _foundOldDAAccountsToMigrate;
  if (foundExchangeFileStays) {
    logRemovalFailure(exchangePath, exchangeRemoval);
  } else {
    const std::string mailPath = mailAccountsPath();
    const Result mailRemoval = files.removeFile(mailPath);
    if (!mailRemoval && _foundOldMailAccountsToMigrate) {
      logRemovalFailure(mailPath, mailRemoval);
    }
  }

  const Result sentinelRemoval = files.removeFile(sentinel);
  if (!sentinelRemoval) {
    logRemovalFailure(sentinel, sentinelRemoval);
  }
  // Kept on purpose: after a migration of mail accounts alone there is no Exchange file to remove,
  // and this is false although nothing went wrong. No caller looks at it.
  return static_cast<bool>(exchangeRemoval);
}

void AccountsDataMigrator::_saveCollatedMigrationInformation() {
  Platform& platform = Process::current().platform;
  logToConsole("Saving collated migration information");
  if (_collatedMigrationData) {
    _collatedMigrationData->set(
        kInformationNewSettings,
        platform.propertyLists.readDictionary(AccountsManager::fullPathToAccountSettingsPlist())
            .value_or(PropertyDictionary()));
  }

  const std::string directory = informationDirectory();
  if (!makeInformationDirectory(platform.fileSystem, directory) || !_collatedMigrationData) {
    return;
  }
  // Kept on purpose: ".txt" for a binary property list; the name is what collectors look for.
  const std::string name = std::string(kInformationFilePrefix)
                               .append(platform.dateFormatter.currentDate(kInformationDatePattern))
                               .append(kInformationFileSuffix);
  if (const auto information = platform.propertyLists.serializeBinary(*_collatedMigrationData)) {
    // The file is a help for engineers: a migration never fails for want of it, nor reports it.
    static_cast<void>(
        platform.fileSystem.writeFileAtomically(joinedPath(directory, name), *information));
  }
}

}  // namespace accounts
