#include "migrator/AccountsDataMigrator.h"

#include <utility>

#include "accountsettings/Log.h"
#include "accountsettings/Process.h"
#include "migrator/MigrationStage.h"
#include "vocabulary/DevicePath.h"
#include "vocabulary/DevicePlaces.h"
#include "vocabulary/DeviceServices.h"
#include "vocabulary/MigrationStages.h"

namespace accounts {

namespace {

void tellMailApplication(Platform& platform) {
  // The file is often absent; a failure to remove it has no consequence.
  static_cast<void>(platform.fileSystem.removeFile(joinedPath(
      platform.mailDirectory.path(), splitPath(listed(DevicePlace::AutoFetchEnabled).path).name)));
  platform.preferencesBroadcast.announceChange(kMailApplication, kMailAccountsPreference);
}

}  // namespace

/// Which migrations a device needs.
struct AccountsDataMigrator::Needs {
  bool oldMailAccounts = false;
  bool oldDAAccounts = false;
  bool newAccountSettings = false;

  [[nodiscard]] bool legacyStores() const { return oldDAAccounts || oldMailAccounts; }
  [[nodiscard]] bool any() const { return legacyStores() || newAccountSettings; }
};

std::string AccountsDataMigrator::dataClassName() {
  return "accounts";
}

bool AccountsDataMigrator::performMigration() {
  std::unique_ptr<NamedLock> lock = AccountsManager::createAndLockMigrationLock();
  bool succeeded = false;
  if (lock != nullptr) {
    succeeded = executeMigrationSteps();
  }
  AccountsManager::releaseMigrationLock(std::move(lock));
  return succeeded;
}

bool AccountsDataMigrator::executeMigrationSteps() {
  AccountsManager::_setShouldSkipNotifications(true);
  runStage("_copyAsideAccountsPlist", "Keep a copy of the settings file for engineers",
           [&] { _copyAsideAccountsPlist(); });

  if (_failedToRemoveOldAccountsInfo()) {
    // Kept on purpose: the "!." ending is what engineers search device logs for.
    logToConsole("Detected that a removal old accounts info was in progress. Early return!.");
    runStage("_removeOldAccountsInfo", "Finish the removal of the legacy stores",
             [&] { static_cast<void>(_removeOldAccountsInfo()); });
    // Kept on purpose: notifications stay switched off on this path; the process ends after it, and
    // nothing that it did is an account change to be told.
    return true;
  }

  Needs needs;
  AccountsManager::shouldMigrateOldMailAccounts_oldDAAccounts_newAccountSettings(
      &needs.oldMailAccounts, &needs.oldDAAccounts, &needs.newAccountSettings);

  MigrationStage opening("initInsideOfMigration", "Open the settings file");
  std::unique_ptr<AccountsManager> store = AccountsManager::initInsideOfMigration();
  opening.end(true, store.get());
  const bool succeeded = !needs.any() || runMigrations(*store, needs);

  // Kept on purpose: a store whose upgrade failed is stamped and saved as well, so that the device
  // keeps what was achieved; the legacy stores then stay.
  MigrationStage saving("saveAllAccounts", "Save the accounts");
  store->setDataVersion(AccountsManager::currentVersion());
  store->saveAllAccounts();
  tellSavedAccounts(*store);
  saving.end(true, store.get());
  store.reset();

  if (succeeded) {
    finishSuccessfulMigration(needs);
  }
  AccountsManager::_setShouldSkipNotifications(false);
  return succeeded;
}

bool AccountsDataMigrator::runMigrations(AccountsManager& store, const Needs& needs) {
  _collatedMigrationData.reset();
  if (_saveMigrationInformation()) {
    _collatedMigrationData.emplace();
  }
  logToConsole("Migrating accounts");

  // Kept on purpose: a conversion's failure is not the migration's. It has been logged, and the
  // upgrade chain's result alone decides; combining the results would keep a device with one broken
  // legacy description from ever finishing.
  if (needs.oldDAAccounts) {
    static_cast<void>(runStage(kExchangeConversionStage, "Convert the legacy Exchange accounts",
                               store, [&] { return _migrateDAAccounts(store); }));
  }
  if (needs.oldMailAccounts) {
    static_cast<void>(runStage(kMailConversionStage, "Convert the legacy mail accounts", store,
                               [&] { return _migrateMailAccounts(store); }));
  }
  return _migrateNewAccountsInfo(store);
}

void AccountsDataMigrator::finishSuccessfulMigration(const Needs& needs) {
  if (needs.legacyStores()) {
    // Its failures are logged where they happen; the accounts are carried over already.
    runStage("_removeOldAccountsInfo", "Remove the legacy stores",
             [&] { static_cast<void>(_removeOldAccountsInfo()); });
  }
  if (_saveMigrationInformation()) {
    runStage("_saveCollatedMigrationInformation", "Write the migration-information file",
             [&] { _saveCollatedMigrationInformation(); });
  }
  runStage("announceChange", "Tell the mail application that its accounts changed",
           [] { tellMailApplication(Process::current().platform); });
}

}  // namespace accounts
