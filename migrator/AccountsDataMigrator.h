#pragma once

#include <cstdint>
#include <optional>
#include <span>
#include <string>
#include <string_view>
#include <vector>

#include "accountsettings/AccountsManager.h"
#include "accountsettings/BasicAccount.h"
#include "migrator/UpgradeStep.h"
#include "platform/MigrationPluginBase.h"
#include "propertylist/value/PropertyValue.h"

extern "C" {
/// Whether this device's region calls the Gmail service "Google Mail"; asked of the device once per
/// process.
bool _UseGoogleMail();
}

namespace accounts {

/// The plug-in's principal class: one instance runs one migration. The operations below
/// performMigration() are its category Internal, called by the migration and by tests alone.
class AccountsDataMigrator : public MigrationPluginBase {
 public:
  AccountsDataMigrator();
  /// With an upgrade chain of the caller's, which must outlive it.
  explicit AccountsDataMigrator(std::span<const UpgradeStep> chain) : chain_(chain) {}

  // Driver (AccountsDataMigrator.cpp)

  std::string dataClassName() override;
  bool performMigration() override;
  /// Runs one migration in full, the lock being held.
  bool executeMigrationSteps();

  // Records and removal of legacy stores (MigrationRecords.cpp)

  /// Keeps a copy of the account settings file for engineers. A failure is logged and otherwise
  /// ignored.
  void _copyAsideAccountsPlist();
  /// Whether a preference asks for the migration-information file; read once per process.
  bool _saveMigrationInformation();
  std::string _absolutePathToOldAccountsInfoRemovalSentinel();
  /// Whether an earlier run was interrupted while it removed the legacy stores.
  bool _failedToRemoveOldAccountsInfo();
  /// Removes the legacy stores under the sentinel. True when the legacy Exchange file was removed
  /// without error.
  bool _removeOldAccountsInfo();
  /// Writes the migration-information file. Failures are logged and otherwise ignored.
  void _saveCollatedMigrationInformation();

  // Legacy mail accounts (MailAccountConversion.cpp)

  /// Converts the legacy mail accounts into records of the store. False, with nothing changed in
  /// the store, when a description could not be converted.
  bool _migrateMailAccounts(AccountsManager& store);
  /// The record of one description, taken as one of a type; null when the record is rejected.
  BasicAccountReference _convertMailAccountDescription_type(const PropertyDictionary& description,
                                                            std::string_view type);
  static std::string_view _accountTypeForMailAccountClass(std::string_view accountClass);
  static std::string_view _accountTypeStringForMailAccountClass(std::string_view accountClass);
  static std::string_view _accountShortTypeStringForMailAccountClass(std::string_view accountClass);

  // Legacy Exchange accounts (ExchangeAccountConversion.cpp)

  /// Converts the legacy Exchange accounts into records of the store. False, with nothing changed
  /// in the store, when a description could not be converted.
  bool _migrateDAAccounts(AccountsManager& store);
  BasicAccountReference _convertExchangeAccountDescription(const PropertyDictionary& description);

  // Upgrade chain (UpgradeChain.cpp)

  /// Upgrades the accounts of the store from the version that the file on disk has. False when a
  /// step failed or the chain has none for that version.
  bool _migrateNewAccountsInfo(AccountsManager& store);
  static bool _newAccountsInformationPresent();

  // Steps; each returns true (FirstTrainSteps.cpp, WebMailCalendars.cpp, SecondTrainSteps.cpp,
  // CloudAccountSteps.cpp)

  bool _migrateAccountsFrom7A149(AccountsManager& store);
  bool _migrateAccountsFrom7A150(AccountsManager& store);
  bool _migrateAccountsFrom7A153(AccountsManager& store);
  bool _migrateAccountsFrom7A241(AccountsManager& store);
  bool _migrateAccountsFrom7A242(AccountsManager& store);
  bool _migrateAccountsFrom8A293(AccountsManager& store);
  bool _migrateAccountsFrom8B117(AccountsManager& store);
  bool _migrateAccountsFrom8C136(AccountsManager& store);
  bool _migrateAccountsFrom8F191(AccountsManager& store);
  bool _migrateAccountsFrom9A182(AccountsManager& store);
  bool _migrateAccountsFrom9A334(AccountsManager& store);
  bool _migrateAccountsFrom9B176(AccountsManager& store);

  /// Whether a list of external sources says that tethered syncing is denied.
  static bool _tetheredDisabledInSources(const PropertyArray& sources);

  // CalDAV matching (CalDAVMatching.cpp)

  static std::string _urlSafeUsername(std::string_view username);
  /// The login names that a calendar account of an umbrella account may have; empty without a user
  /// name.
  static std::vector<std::string> _expectedCalDAVUsernamesForAccount(const BasicAccount& account);
  static std::optional<std::string> _expectedCalDAVHostnameForAccount(const BasicAccount& account);
  static std::vector<std::string> _expectedCalDAVPrincipalURLsForAccount(
      const BasicAccount& account);
  /// Whether a stand-alone CalDAV account is the calendar half of a mail account.
  static bool _calDAVAccount_matchesUmbrellaAccount(const BasicAccount& calDAVAccount,
                                                    const BasicAccount& umbrellaAccount);

  // Children (CloudAccountSteps.cpp)

  static bool _account_hasChildAccountOfType(const BasicAccount& account, std::string_view type);
  static void _enableProvisioningForDataClass_toAccount_ifChildAccountExistsOfType(
      std::string_view dataclass, BasicAccount& account, std::string_view type);

  /// What the migration collected for the information file; none unless that is asked for.
  [[nodiscard]] const std::optional<PropertyDictionary>& collatedMigrationData() const {
    return _collatedMigrationData;
  }

 private:
  struct Needs;

  /// Runs the conversions that are needed and the upgrade chain, whose result is returned.
  bool runMigrations(AccountsManager& store, const Needs& needs);
  /// Cleans up after a migration that succeeded and tells others of it.
  void finishSuccessfulMigration(const Needs& needs);
  /// Puts a file's contents, an empty dictionary standing in for none, into the collated data if
  /// migration information is saved.
  void collect(std::string_view key, const std::optional<PropertyDictionary>& contents);
  /// Converts the outgoing and incoming accounts of the legacy mail store and puts them into the
  /// store. False, with nothing changed in the store, at the first that cannot be converted.
  bool replaceMailAccounts(AccountsManager& store, const PropertyDictionary& legacyAccounts);

  std::span<const UpgradeStep> chain_;
  std::optional<PropertyDictionary> _collatedMigrationData;
  bool _foundOldMailAccountsToMigrate = false;
  bool _foundOldDAAccountsToMigrate = false;
};

}  // namespace accounts
