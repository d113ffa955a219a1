#pragma once

#include <cstdint>
#include <map>
#include <memory>
#include <optional>
#include <string>
#include <string_view>
#include <vector>

#include "accountsettings/BasicAccount.h"
#include "accountsettings/IdentifierIndex.h"
#include "accountsettings/NewestSave.h"
#include "accountsettings/OrderedAccounts.h"
#include "accountsettings/RuntimeFixer.h"
#include "platform/MigrationObserver.h"
#include "platform/SharedResources.h"
#include "propertylist/value/PropertyValue.h"
#include "vocabulary/DevicePlaces.h"

extern "C" {
/// The device path of the legacy Exchange account file.
std::string daAccountPath();
/// The device path of the legacy mail account preferences.
std::string mailAccountsPath();
/// The device path of the account settings file.
std::string accountSettingsAccountsPath();
}

namespace accounts {

/// The account-settings store: the accounts of the account settings file in memory, to be looked
/// up, changed and saved. All changes stay in memory until saveAllAccounts(). Nothing reports an
/// error to the caller; failures show on the log channel and in the file. For one thread at a time;
/// several stores may exist at once.
class AccountsManager {
 public:
  using Accounts = std::vector<BasicAccountReference>;
  /// Account types, in any order.
  using Types = std::vector<std::string_view>;

  // Loading (AccountsManager.cpp)

  /// The data version that this code writes.
  static constexpr std::uint64_t currentVersion() { return kMigratedVersion; }
  /// The device path of the account settings file, computed on every call.
  static std::string fullPathToAccountSettingsPlist();
  /// Switches the sending of change notifications off or on for the whole process.
  static void _setShouldSkipNotifications(bool skip);

  /// A store with the accounts of the file; an empty one when the file is missing or unreadable.
  static std::unique_ptr<AccountsManager> init();
  static std::unique_ptr<AccountsManager> initInsideOfMigration();
  /// A store with the accounts of an array, no file being read. The misspelt name must stay.
  static std::unique_ptr<AccountsManager> initWithAccounsInfoArray(const PropertyArray& accounts);

  [[nodiscard]] std::uint64_t dataVersion() const { return _dataVersion; }
  /// Stamps the store in memory; a save always writes currentVersion().
  void setDataVersion(std::uint64_t version) { _dataVersion = version; }

  // Queries (AccountsManagerQueries.cpp)

  /// The top-level account with an identifier; for a child's identifier the child's top-level
  /// parent. Null for none.
  [[nodiscard]] BasicAccountReference accountWithIdentifier(std::string_view identifier) const;
  /// The top-level account to show for a sync identifier. Null for none.
  [[nodiscard]] BasicAccountReference displayAccountWithSyncIdentifier(
      std::string_view syncIdentifier) const;
  /// The first top-level account, else the first child, with a sync identifier. Null for none.
  [[nodiscard]] BasicAccountReference syncableAccountWithSyncIdentifier(
      std::string_view syncIdentifier) const;
  /// The store's own list of top-level accounts, in order, not a copy: a change to the store
  /// changes it (deleted accounts leave it at the next call), and ends any walk through it.
  [[nodiscard]] const Accounts& allBasicAccounts() const;
  /// All top-level accounts in order, then all children in the order in which they were indexed.
  [[nodiscard]] Accounts allBasicSyncableAccounts() const;
  /// The top-level accounts of these types, in store order.
  [[nodiscard]] Accounts basicAccountsWithTypes(const Types& types) const;
  [[nodiscard]] std::uint64_t countOfBasicAccountsWithTypes(const Types& types) const;
  /// The number of top-level accounts.
  [[nodiscard]] std::uint64_t count() const;

  // Mutations (AccountsManagerMutations.cpp, AccountsManagerReplacement.cpp)

  /// Puts a record in the place of every top-level account with its identifier; never inserts.
  void updateAccount(const BasicAccountReference& account);
  /// Appends a record unless its identifier is already there; never replaces.
  void insertAccount(const BasicAccountReference& account);
  void deleteAccount(const BasicAccountReference& account);
  void deleteAccountWithIdentifier(std::string_view identifier);
  /// Puts a record in the place of another one, which must be in the store (a fatal assertion
  /// otherwise). The new record is not found by its identifier until the store is loaded again.
  void replaceAccount_withAccount(const BasicAccountReference& oldAccount,
                                  const BasicAccountReference& newAccount);
  /// Replaces all top-level accounts of some types by the given ones. An account with the
  /// identifier of one that is there takes its place; other new ones go to the end; children go to
  /// their parents.
  void replaceAccountsWithTypes_withAccounts(const Types& types, const Accounts& accounts);
  void removeChildWithIdentifier_fromAccount(std::string_view identifier,
                                             const BasicAccountReference& parent);
  void addChild_toAccount(const BasicAccountReference& child, const BasicAccountReference& parent);
  void _removeChildrenForAccountWithIdentifier(const std::optional<Text>& parentIdentifier);

  // Saving (AccountsManagerSaving.cpp)

  /// Writes all top-level accounts to the account settings file, each merged with what changed on
  /// disk since it was loaded. A failure is logged and leaves the file as it was.
  void saveAllAccounts();
  /// The three-way merge of one account's properties, with its channel lines. Any side may be
  /// absent.
  static PropertyDictionary mergeInMemoryProperties_originalProperties_onDiskProperties(
      const PropertyDictionary& inMemory, const std::optional<PropertyDictionary>& original,
      const std::optional<PropertyDictionary>& onDisk);

  // Full accounts (AccountsManagerFullAccounts.cpp). A full account that cannot be made is a fatal
  // assertion.

  /// The full account of the first account of type "OnMyDevice", which is created, in memory, if
  /// the store has none. Never null.
  FullAccountReference fullDeviceLocalAccount();
  /// The full account of the top-level account with an identifier, else of the child with it; null
  /// for no, an empty or an unknown identifier. The loader may be null.
  [[nodiscard]] FullAccountReference fullAccountWithIdentifier_loader(
      std::optional<std::string_view> identifier, FullAccountLoader* loader) const;
  /// The full accounts of these types in store order, each top-level account followed by its
  /// children.
  [[nodiscard]] std::vector<FullAccountReference> accountsWithTypes(const Types& types) const;
  [[nodiscard]] std::vector<FullAccountReference> accountsWithTypes_withLoader(
      const Types& types, FullAccountLoader* loader) const;
  /// The full accounts of the types "Mail", "Velmora", "Gmail" and "Yahoo".
  [[nodiscard]] std::vector<FullAccountReference> allMailAccounts() const;

  // Change notifications (AccountsManagerNotifications.cpp). An error in the account-creation map,
  // a framework that cannot be loaded and a class that cannot be found are fatal assertions.

  /// The names of the notifier classes that a change of a dataclass concerns, in the map's order,
  /// duplicates kept; their frameworks are loaded. No type is an error in the map.
  static std::vector<Text> _notifierClassNamesForAccountType_dataclass(
      const std::optional<Text>& type, std::string_view dataclass);
  /// Tells the notifiers concerned that a dataclass of an account is about to change, or did.
  static void accountWillChange_forDataclass(const BasicAccount& account,
                                             std::string_view dataclass);
  static void accountDidChange_forDataclass(const BasicAccount& account,
                                            std::string_view dataclass);
  /// The localised name of a group of accounts; only subscribed calendars have one.
  static std::optional<std::string> displayNameForGroupOfAccountType_forBeginningOfSentence(
      std::string_view type, bool beginningOfSentence);
  /// Change records by the name of the notifier class that receives them.
  using NotificationBatch = std::map<Text, std::vector<PropertyValue>, std::less<>>;
  /// Adds a record of a change for each notifier class that it concerns. The original properties
  /// are none for an added account, the current ones none for a deleted one.
  static void _addNotificationToDictionary_forChangeType_originalProperties_currentProperties(
      NotificationBatch& batch, AccountChangeType changeType,
      const std::optional<PropertyDictionary>& original,
      const std::optional<PropertyDictionary>& current);

  // Migration support (AccountsManagerMigrationSupport.cpp)

  /// Makes the migration lock and takes it, waiting while another process holds it. Null when no
  /// lock object can be made. The caller gives it back with releaseMigrationLock().
  static std::unique_ptr<NamedLock> createAndLockMigrationLock();
  /// Unlocks and destroys the lock; null does nothing.
  static void releaseMigrationLock(std::unique_ptr<NamedLock> lock);
  /// Returns when no migration holds the lock.
  static void waitForMigrationToFinish();
  /// Decides from the files on disk what a migration has to do. A null pointer is a fatal
  /// assertion.
  static void shouldMigrateOldMailAccounts_oldDAAccounts_newAccountSettings(
      bool* migrateOldMailAccounts, bool* migrateOldDAAccounts, bool* migrateNewAccounts);
  /// Whether the account settings file is older than currentVersion().
  static bool accountSettingsNeedsToBeMigrated();
  /// Removes the account settings file, so that a later migration builds it anew from the legacy
  /// stores.
  static void removeNewAccountSettingsToMigrateOldAccountInformation();
  static bool _oldMailAccountsInformationFound();
  static bool _oldDAAccountsInformationFound();

  // Internal operations, for the store and its tests (AccountsManager.cpp)

  void _loadChildrenFromAccount(const BasicAccountReference& account);
  void _setOriginalAccountDictionaries();
  static std::vector<std::unique_ptr<RuntimeFixer>> _createRuntimeFixers();
  /// The baseline of change notifications: the properties of each top-level account as last loaded
  /// or notified.
  [[nodiscard]] const IdentifierIndex<PropertyDictionary>& _originalAccounts() const {
    return _originalAccountsByID;
  }

 private:
  AccountsManager() = default;

  // Loading
  static std::unique_ptr<AccountsManager> _initWithAccountsInfo(
      const std::optional<PropertyArray>& accounts, MigrationObserver* observer);
  /// Tells whoever observes the migration of this store what becomes of an account.
  void _tell(const AccountEvent& event) const {
    if (_observer != nullptr) {
      _observer->accountFared(event);
    }
  }
  /// Puts a record at the end of the top-level accounts and indexes it and its children.
  void _takeIn(const BasicAccountReference& account);
  /// Runs every fixer on a record; the gravest result.
  FixResult _fixAccount(BasicAccount& account, std::string_view occasion);
  void _tellRuntimeFixers(bool accountsHaveBeenSaved);

  // Queries
  void _indexSyncIdentifiersOf(const IdentifierIndex<BasicAccountReference>& accounts) const;

  // Mutations
  /// What replaceAccountsWithTypes:withAccounts: makes of the store's accounts.
  struct Replacement;
  void _keepOrReplaceAccounts(const Types& types, const Accounts& accounts,
                              Replacement& replacement);
  void _addRemainingAccounts(const Accounts& accounts, Replacement& replacement);
  /// Takes a child out of the account among `parents` that holds it now, if any, and adds it to the
  /// one with its parent's identifier, if any.
  void _moveChild(const BasicAccountReference& child,
                  const IdentifierIndex<BasicAccountReference>& parents);

  // Saving
  /// Runs the fixers on all top-level accounts; the gravest result.
  FixResult _fixAccountsBeforeSaving();
  /// Tells every notifier class, in one call each, what changed since the baseline was taken.
  void _sendNotificationsForChangedAccounts() const;
  /// What is to be written: all top-level accounts, merged with the file as it is now.
  [[nodiscard]] PropertyArray _mergedAccounts() const;

  IdentifierIndex<BasicAccountReference> _topLevelAccountsByID;
  OrderedAccounts _orderedTopLevelAccounts;
  IdentifierIndex<BasicAccountReference> _childAccountsByID;
  IdentifierIndex<Text> _childAccountIDToParentAccountID;
  IdentifierIndex<PropertyDictionary> _originalAccountsByID;
  /// Null for a store that nobody observes, such as one that a save makes.
  MigrationObserver* _observer = nullptr;
  std::uint64_t _dataVersion = 0;
  std::vector<std::unique_ptr<RuntimeFixer>> _runtimeFixers;
  NewestSave _newestSave;

  // The children that were indexed under each parent since its children were last removed; some may
  // have gone to another parent since. Spares a walk through all children for each parent.
  IdentifierIndex<std::vector<Text>> _childIdentifiersByParentID;

  // The first account of each sync identifier, made anew when the accounts or their sync
  // identifiers are no longer those of the stamp.
  struct SyncIndexStamp {
    std::uint64_t syncIdentifierChanges;
    std::uint64_t topLevelChanges;
    std::uint64_t childChanges;
    bool operator==(const SyncIndexStamp&) const = default;
  };
  mutable std::optional<SyncIndexStamp> _accountsBySyncIDStamp;
  mutable IdentifierIndex<BasicAccountReference> _accountsBySyncID;
};

}  // namespace accounts
