#include <array>
#include <string>
#include <utility>

#include "accountsettings/AccountsManager.h"
#include "accountsettings/Log.h"
#include "accountsettings/Process.h"
#include "vocabulary/DevicePlaces.h"

namespace {

std::string pathInHomeDirectory(accounts::DevicePlace place) {
  return accounts::pathOfPlace(place, accounts::Process::current().platform.homeDirectory.path());
}

}  // namespace

std::string daAccountPath() {
  return pathInHomeDirectory(accounts::DevicePlace::LegacyExchange);
}

std::string mailAccountsPath() {
  return pathInHomeDirectory(accounts::DevicePlace::LegacyMail);
}

std::string accountSettingsAccountsPath() {
  return accounts::AccountsManager::fullPathToAccountSettingsPlist();
}

namespace accounts {

namespace {

std::unique_ptr<NamedLock> makeMigrationLock() {
  return Process::current().platform.sharedResources.makeLock(kMigrationLockName);
}

bool fileExists(std::string_view path) {
  return Process::current().platform.fileSystem.fileExists(path);
}

}  // namespace

std::unique_ptr<NamedLock> AccountsManager::createAndLockMigrationLock() {
  std::unique_ptr<NamedLock> lock = makeMigrationLock();
  if (lock) {
    lock->lock();
  }
  return lock;
}

void AccountsManager::releaseMigrationLock(std::unique_ptr<NamedLock> lock) {
  if (lock) {
    lock->unlock();
  }
}

void AccountsManager::waitForMigrationToFinish() {
  releaseMigrationLock(createAndLockMigrationLock());
}

void AccountsManager::shouldMigrateOldMailAccounts_oldDAAccounts_newAccountSettings(
    bool* migrateOldMailAccounts, bool* migrateOldDAAccounts, bool* migrateNewAccounts) {
  static constexpr std::string_view kOperation =
      "+[AccountsManager(MigrationSupport) "
      "shouldMigrateOldMailAccounts:oldDAAccounts:newAccountSettings:]";
  const std::array<std::pair<const bool*, std::string_view>, 3> required = {
      {{migrateOldMailAccounts, "migrateOldMailAccounts cannot be nil"},
       {migrateOldDAAccounts, "migrateOldDAAccounts cannot be nil"},
       {migrateNewAccounts, "migrateNewAccounts cannot be nil"}}};
  for (const auto& [reference, message] : required) {
    if (reference == nullptr) {
      failAssertion(kOperation, kManagerSourceFile, message);
    }
  }
  *migrateOldMailAccounts = _oldMailAccountsInformationFound();
  *migrateOldDAAccounts = _oldDAAccountsInformationFound();
  // Account settings that are about to be built from the legacy stores need no upgrade: their
  // version does not matter then.
  const bool hasLegacyAccounts = *migrateOldMailAccounts || *migrateOldDAAccounts;
  *migrateNewAccounts = !hasLegacyAccounts && accountSettingsNeedsToBeMigrated();
  if (hasLegacyAccounts || *migrateNewAccounts) {
    logToChannel(kOperation,
                 "Accounts settings needs migration! oldMailAccountsPresent=%d, "
                 "oldDAAccountsPresent=%d, migrateNewAccountsInfo=%d",
                 [&] {
                   return logArguments(*migrateOldMailAccounts, *migrateOldDAAccounts,
                                       *migrateNewAccounts);
                 });
  }
}

bool AccountsManager::accountSettingsNeedsToBeMigrated() {
  static constexpr std::string_view kOperation =
      "+[AccountsManager(MigrationSupport) accountSettingsNeedsToBeMigrated]";
  const std::optional<PropertyDictionary> root =
      Process::current().platform.propertyLists.readDictionary(fullPathToAccountSettingsPlist());
  if (!root) {
    return false;
  }
  const PropertyValue* version = root->find(kPlistVersionKey);
  const std::optional<std::int64_t> savedVersion =
      version != nullptr ? version->integerValue() : std::nullopt;
  if (!savedVersion) {
    logToChannel(kOperation,
                 "Account Settings plist is missing a version number, returning NO for migration");
    return false;
  }
  // Kept on purpose: the comparison is unsigned, so a negative version, which only a writer unknown
  // to this system can have stored, counts as newer than every version and is left alone.
  const bool isOutOfDate = static_cast<std::uint64_t>(*savedVersion) < currentVersion();
  if (isOutOfDate) {
    logToChannel(kOperation,
                 "Account Settings Version out of date: savedVersion=%ld, currentVersion=%ld",
                 [&] { return logArguments(*savedVersion, currentVersion()); });
  }
  return isOutOfDate;
}

void AccountsManager::removeNewAccountSettingsToMigrateOldAccountInformation() {
  const std::string path = fullPathToAccountSettingsPlist();
  if (!fileExists(path)) {
    return;
  }
  const Result removal = Process::current().platform.fileSystem.removeFile(path);
  if (!removal) {
    logToChannel(
        "+[AccountsManager(MigrationSupport) "
        "removeNewAccountSettingsToMigrateOldAccountInformation]",
        "Could not remove %@. Error %@", [&] { return logArguments(path, removal.error().text); });
  }
}

bool AccountsManager::_oldMailAccountsInformationFound() {
  return fileExists(mailAccountsPath());
}

bool AccountsManager::_oldDAAccountsInformationFound() {
  return fileExists(daAccountPath());
}

}  // namespace accounts
