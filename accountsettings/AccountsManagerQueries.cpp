#include <algorithm>

#include "accountsettings/AccountsManager.h"
#include "accountsettings/Process.h"

namespace accounts {

namespace {

bool isOfTypes(const BasicAccount& account, const AccountsManager::Types& types) {
  const std::optional<Text> type = account.type();
  return type && std::find(types.begin(), types.end(), type->view()) != types.end();
}

BasicAccountReference valueOrNull(const BasicAccountReference* account) {
  return account != nullptr ? *account : nullptr;
}

}  // namespace

BasicAccountReference AccountsManager::accountWithIdentifier(std::string_view identifier) const {
  if (const BasicAccountReference* account = _topLevelAccountsByID.find(identifier)) {
    return *account;
  }
  const Text* parentIdentifier = _childAccountIDToParentAccountID.find(identifier);
  return parentIdentifier != nullptr ? valueOrNull(_topLevelAccountsByID.find(*parentIdentifier))
                                     : nullptr;
}

BasicAccountReference AccountsManager::displayAccountWithSyncIdentifier(
    std::string_view syncIdentifier) const {
  const BasicAccountReference account = syncableAccountWithSyncIdentifier(syncIdentifier);
  const std::optional<Text> identifier = account ? account->identifier() : std::nullopt;
  return identifier ? accountWithIdentifier(*identifier) : nullptr;
}

BasicAccountReference AccountsManager::syncableAccountWithSyncIdentifier(
    std::string_view syncIdentifier) const {
  const SyncIndexStamp now = {Process::current().syncIdentifierChanges,
                              _topLevelAccountsByID.changeCount(),
                              _childAccountsByID.changeCount()};
  if (_accountsBySyncIDStamp != now) {
    _accountsBySyncID.clear();
    _indexSyncIdentifiersOf(_topLevelAccountsByID);
    _indexSyncIdentifiersOf(_childAccountsByID);
    _accountsBySyncIDStamp = now;
  }
  return valueOrNull(_accountsBySyncID.find(syncIdentifier));
}

void AccountsManager::_indexSyncIdentifiersOf(
    const IdentifierIndex<BasicAccountReference>& accounts) const {
  for (const auto& [identifier, account] : accounts.inOrder()) {
    const std::optional<Text> syncIdentifier = account->syncStoreIdentifier();
    if (syncIdentifier && !_accountsBySyncID.contains(*syncIdentifier)) {
      _accountsBySyncID.set(*syncIdentifier, account);
    }
  }
}

const AccountsManager::Accounts& AccountsManager::allBasicAccounts() const {
  return _orderedTopLevelAccounts.accounts();
}

AccountsManager::Accounts AccountsManager::allBasicSyncableAccounts() const {
  Accounts accounts = _orderedTopLevelAccounts.accounts();
  for (const auto& [identifier, child] : _childAccountsByID.inOrder()) {
    accounts.push_back(child);
  }
  return accounts;
}

AccountsManager::Accounts AccountsManager::basicAccountsWithTypes(const Types& types) const {
  Accounts accounts;
  for (const BasicAccountReference& account : _orderedTopLevelAccounts.accounts()) {
    if (isOfTypes(*account, types)) {
      accounts.push_back(account);
    }
  }
  return accounts;
}

std::uint64_t AccountsManager::countOfBasicAccountsWithTypes(const Types& types) const {
  return basicAccountsWithTypes(types).size();
}

std::uint64_t AccountsManager::count() const {
  return _orderedTopLevelAccounts.size();
}

}  // namespace accounts
