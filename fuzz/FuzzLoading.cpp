#include <algorithm>

#include "accountsettings/AccountsManager.h"
#include "fuzz/AccountValues.h"
#include "fuzz/FuzzTarget.h"
#include "fuzz/FuzzedDevice.h"
#include "fuzz/StoreChanges.h"

namespace accounts {

namespace {

/// What the lists of a record must be to each other.
void checkDataclasses(const BasicAccount& account) {
  const PropertyArray supported = account.supportedDataclasses();
  const PropertyArray provisioned = account.provisionedDataclasses();
  for (const PropertyValue& dataclass : provisioned) {
    require(supported.containsText(*dataclass.asText()),
            "what an account is provisioned for is supported");
  }
  for (const PropertyValue& dataclass : account.enabledDataclasses().value_or(PropertyArray())) {
    require(account.isEnabledForDataclass(*dataclass.asText()),
            "what is listed as enabled is enabled");
  }
}

void checkTopLevelAccount(const AccountsManager& store, const BasicAccount& account) {
  require(BasicAccount::_isValidAccountType(account.type()), "a loaded account has a known type");
  require(!account.accountClass().value_or(Text()).empty(), "a loaded account has a class");
  const std::optional<Text> identifier = account.identifier();
  require(identifier.has_value(), "a loaded account has an identifier");
  const BasicAccountReference found = store.accountWithIdentifier(*identifier);
  require(found && found->identifier() == identifier,
          "a loaded account's identifier leads to an account with it");
  const std::optional<Text> syncIdentifier = account.syncStoreIdentifier();
  // Of accounts that share an identifier only the one that it leads to is looked up otherwise.
  if (syncIdentifier && found.get() == &account) {
    require(store.displayAccountWithSyncIdentifier(*syncIdentifier) != nullptr,
            "a loaded account's sync identifier leads to an account");
  }
  require(store.countOfBasicAccountsWithTypes({account.type()->view()}) > 0,
          "a loaded account is among those of its type");
  checkDataclasses(account);
}

void checkChild(const AccountsManager& store, const BasicAccount& child) {
  const BasicAccountReference& parent = child.parentAccount();
  require(parent != nullptr, "an indexed child has a parent");
  const PropertyArray dictionaries =
      parent->arrayPropertyForKey(kAccountChildAccounts).value_or(PropertyArray());
  const PropertyValue original = child.originalProperties().value_or(PropertyDictionary());
  require(std::find(dictionaries.begin(), dictionaries.end(), original) != dictionaries.end(),
          "an indexed child is one of its parent's dictionaries");
  require(store.accountWithIdentifier(child.identifier().value_or(Text())) != nullptr,
          "an indexed child's identifier leads to a top-level account");
  checkDataclasses(child);
}

void checkIndexes(const AccountsManager& store) {
  const AccountsManager::Accounts all = store.allBasicSyncableAccounts();
  require(store.count() == store.allBasicAccounts().size(), "the count is that of the accounts");
  for (std::size_t index = 0; index < all.size(); ++index) {
    if (index < store.count()) {
      checkTopLevelAccount(store, *all[index]);
    } else {
      checkChild(store, *all[index]);
    }
  }
}

PropertyArray propertiesOf(const AccountsManager& store) {
  PropertyArray list;
  for (const BasicAccountReference& account : store.allBasicAccounts()) {
    list.append(account->propertiesToSave());
  }
  return list;
}

/// How many of some accounts' child dictionaries are accepted as accounts.
std::size_t countOfAcceptedChildren(const AccountsManager::Accounts& accounts) {
  std::size_t count = 0;
  for (const BasicAccountReference& account : accounts) {
    for (const PropertyValue& child :
         account->properties().arrayForKey(kAccountChildAccounts).value_or(PropertyArray())) {
      const PropertyDictionary* dictionary = child.asDictionary();
      count += dictionary != nullptr && BasicAccount::initWithProperties(*dictionary) ? 1 : 0;
    }
  }
  return count;
}

/// A store that nobody changed is saved as it was loaded, loads as it was saved, and is saved to
/// the same bytes again. Where several accounts share an identifier the file's last one holds for
/// all of them, so nothing is said of those.
void checkThatSavingKeeps(const FuzzedDevice& device, AccountsManager& store) {
  const PropertyArray loaded = propertiesOf(store);
  store.saveAllAccounts();
  const PropertyArray saved = device.savedAccounts();
  require(saved.size() == loaded.size(), "every loaded account is saved");
  if (!haveDistinctIdentifiers(loaded)) {
    return;
  }
  require(store.allBasicSyncableAccounts().size() ==
              store.count() + countOfAcceptedChildren(store.allBasicAccounts()),
          "every child that is accepted is indexed");
  requireEqual(saved, loaded, "what was loaded is saved as it was");
  requireEqual(propertiesOf(*AccountsManager::initInsideOfMigration()), saved,
               "what was saved is loaded as it was");

  const std::optional<std::string> bytes = device.fileSystem.contentsOf(kSettingsPath);
  store.saveAllAccounts();
  require(device.fileSystem.contentsOf(kSettingsPath) == bytes,
          "saving twice gives the same bytes");
}

}  // namespace

/// A store is loaded from any file, answers queries, is changed in any way and saved.
void runOneInput(std::string_view bytes) {
  FuzzInput input(bytes);
  FuzzedDevice device;
  const Process process(device.platform);
  // Notifiers are frameworks' classes, which are not here.
  AccountsManager::_setShouldSkipNotifications(true);
  device.logSystem.channel.enabled = input.below(8) == 7;
  device.addAnything(input, kSettingsPath, settingsFrom);
  // A directory in the file's place would only keep it from being saved.
  device.fileSystem.directories.erase(std::string(kSettingsPath));

  const std::unique_ptr<AccountsManager> store = AccountsManager::initInsideOfMigration();
  checkIndexes(*store);
  checkThatSavingKeeps(device, *store);

  if (!input.isUsedUp()) {
    changeStore(input, device, *store);
    store->saveAllAccounts();
    require(device.savedAccounts().size() == store->count(), "every account is saved");
    checkIndexes(*AccountsManager::initInsideOfMigration());
  }
}

}  // namespace accounts
