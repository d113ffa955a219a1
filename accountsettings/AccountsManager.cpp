#include "accountsettings/AccountsManager.h"

#include <algorithm>

#include "accountsettings/ASRuntimeFixMailAccount.h"
#include "accountsettings/Log.h"
#include "accountsettings/Process.h"
#include "vocabulary/DevicePath.h"
#include "vocabulary/DevicePlaces.h"

namespace accounts {

namespace {

/// The record of an element of an array of account dictionaries; null when the element is no
/// acceptable account dictionary.
BasicAccountReference recordOf(const PropertyValue& element) {
  const PropertyDictionary* properties = element.asDictionary();
  return properties != nullptr ? BasicAccount::initWithProperties(*properties) : nullptr;
}

AccountOrigin elementOfFile(std::size_t index) {
  return {AccountOrigin::Kind::Settings, static_cast<std::uint32_t>(index)};
}

}  // namespace

std::string AccountsManager::fullPathToAccountSettingsPlist() {
  return joinedPath(Process::current().platform.sharedResources.systemRootDirectory(),
                    listed(DevicePlace::Settings).path);
}

void AccountsManager::_setShouldSkipNotifications(bool skip) {
  Process::current().shouldSkipNotifications = skip;
}

std::unique_ptr<AccountsManager> AccountsManager::init() {
  return initInsideOfMigration();
}

std::unique_ptr<AccountsManager> AccountsManager::initInsideOfMigration() {
  const PropertyDictionary root =
      Process::current()
          .platform.propertyLists.readDictionary(fullPathToAccountSettingsPlist())
          .value_or(PropertyDictionary());
  std::unique_ptr<AccountsManager> store = _initWithAccountsInfo(
      root.arrayForKey(kPlistAccountsKey), Process::current().platform.migrationObserver);
  if (const PropertyValue* version = root.find(kPlistVersionKey)) {
    store->_dataVersion = static_cast<std::uint64_t>(version->integerValue().value_or(0));
  }
  return store;
}

std::unique_ptr<AccountsManager> AccountsManager::initWithAccounsInfoArray(
    const PropertyArray& accounts) {
  return _initWithAccountsInfo(accounts, nullptr);
}

std::unique_ptr<AccountsManager> AccountsManager::_initWithAccountsInfo(
    const std::optional<PropertyArray>& accounts, MigrationObserver* observer) {
  std::unique_ptr<AccountsManager> store(new AccountsManager());
  store->_observer = observer;
  store->_runtimeFixers = _createRuntimeFixers();
  bool fixersChangedAccounts = false;
  std::size_t index = 0;
  for (const PropertyValue& element : accounts.value_or(PropertyArray())) {
    const AccountOrigin origin = elementOfFile(index++);
    const BasicAccountReference account = recordOf(element);
    if (!account) {
      logToChannel("-[AccountsManager _initWithAccountsInfo:]",
                   "ERROR: Failed to create a BasicAccount from %@",
                   [&] { return logArguments(element); });
      store->_tell({origin, ToldFate::Refused, {}, BasicAccount::whyRefused(element)});
      continue;
    }
    account->setOrigin(origin);
    const FixResult result = store->_fixAccount(*account, "loading accounts");
    fixersChangedAccounts |= result != FixResult::Unchanged;
    if (result != FixResult::CannotBeKept) {
      store->_takeIn(account);
    } else {
      store->_tell({origin, ToldFate::Refused, {}, "nothing tells the class of the mail account"});
    }
  }
  if (fixersChangedAccounts) {
    store->_tellRuntimeFixers(false);
  }
  store->_setOriginalAccountDictionaries();
  return store;
}

void AccountsManager::_takeIn(const BasicAccountReference& account) {
  if (const std::optional<Text> identifier = account->identifier()) {
    _topLevelAccountsByID.set(*identifier, account);
  }
  _orderedTopLevelAccounts.append(account);
  _loadChildrenFromAccount(account);
}

void AccountsManager::_loadChildrenFromAccount(const BasicAccountReference& account) {
  const std::optional<Text> parentIdentifier = account->identifier();
  _removeChildrenForAccountWithIdentifier(parentIdentifier);
  const std::optional<PropertyArray> children = account->arrayPropertyForKey(kAccountChildAccounts);
  for (const PropertyValue& element : children.value_or(PropertyArray())) {
    const BasicAccountReference child = recordOf(element);
    if (child) {
      child->setParentAccount(account);
    }
    const std::optional<Text> identifier = child ? child->identifier() : std::nullopt;
    if (!identifier) {
      logToChannel("-[AccountsManager _loadChildrenFromAccount:]",
                   "Ignoring unknown child account with properties %@",
                   [&] { return logArguments(element); });
    } else if (parentIdentifier) {
      const Text* indexedParent = _childAccountIDToParentAccountID.find(*identifier);
      if (indexedParent == nullptr || *indexedParent != *parentIdentifier) {
        _childIdentifiersByParentID[*parentIdentifier].push_back(*identifier);
      }
      _childAccountsByID.set(*identifier, child);
      _childAccountIDToParentAccountID.set(*identifier, *parentIdentifier);
    }
  }
}

void AccountsManager::_setOriginalAccountDictionaries() {
  _originalAccountsByID.clear();
  for (const BasicAccountReference& account : _orderedTopLevelAccounts.accounts()) {
    if (const std::optional<Text> identifier = account->identifier()) {
      _originalAccountsByID.set(*identifier, account->propertiesToSave());
    } else {
      logToChannel("-[AccountsManager _setOriginalAccountDictionaries]",
                   "%@ returned a nil identifier. Account properties may not get saved",
                   [&] { return logArguments(account->properties()); });
    }
  }
}

std::vector<std::unique_ptr<RuntimeFixer>> AccountsManager::_createRuntimeFixers() {
  std::vector<std::unique_ptr<RuntimeFixer>> fixers;
  fixers.push_back(std::make_unique<ASRuntimeFixMailAccount>());
  return fixers;
}

FixResult AccountsManager::_fixAccount(BasicAccount& account, std::string_view occasion) {
  FixResult result = FixResult::Unchanged;
  for (const std::unique_ptr<RuntimeFixer>& fixer : _runtimeFixers) {
    result = std::max(result, fixer->fixBasicAccountIfNeeded_loggingMessage(account, occasion));
  }
  return result;
}

void AccountsManager::_tellRuntimeFixers(bool accountsHaveBeenSaved) {
  for (const std::unique_ptr<RuntimeFixer>& fixer : _runtimeFixers) {
    fixer->accountsHaveBeenSaved(accountsHaveBeenSaved);
  }
}

}  // namespace accounts
