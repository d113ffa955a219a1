#include <algorithm>
#include <iterator>
#include <utility>

#include "accountsettings/AccountsManager.h"
#include "accountsettings/Log.h"

// A caller may well pass a reference out of the store's own list. So whatever an operation still
// needs of an account after it has changed the list, it takes a reference of its own to first.

namespace accounts {

namespace {

std::optional<PropertyDictionary> propertiesToLog(const BasicAccountReference& account) {
  return account ? std::optional(account->properties()) : std::nullopt;
}

/// The identifier of the account that an element of a "ChildAccounts" array makes; none when it
/// makes no account. An element without an identifier of its own makes an account with a fresh one
/// each time.
std::optional<Text> identifierOfChildElement(const PropertyValue& element) {
  const PropertyDictionary* properties = element.asDictionary();
  const BasicAccountReference child =
      properties != nullptr ? BasicAccount::initWithProperties(*properties) : nullptr;
  return child ? child->identifier() : std::nullopt;
}

}  // namespace

void AccountsManager::updateAccount(const BasicAccountReference& account) {
  logToChannel("-[AccountsManager updateAccount:]", "Updating account: %@",
               [&] { return logArguments(propertiesToLog(account)); });
  // The argument may stand in the store itself, which is about to change.
  // NOLINTNEXTLINE(performance-unnecessary-copy-initialization)
  const BasicAccountReference updated = account;
  const std::optional<Text> identifier = updated->identifier();
  const std::size_t places =
      identifier ? _orderedTopLevelAccounts.replaceAll(*identifier, updated) : 0;
  if (places > 0) {
    _topLevelAccountsByID.set(*identifier, updated);
  }
  // Again for each place that the account takes: the lines about its children say so.
  for (std::size_t place = 0; place < places; ++place) {
    _loadChildrenFromAccount(updated);
  }
}

void AccountsManager::insertAccount(const BasicAccountReference& account) {
  logToChannel("-[AccountsManager insertAccount:]", "Inserting account: %@",
               [&] { return logArguments(propertiesToLog(account)); });
  // NOLINTNEXTLINE(performance-unnecessary-copy-initialization): as in updateAccount().
  const BasicAccountReference inserted = account;
  const std::optional<Text> identifier = inserted->identifier();
  if (!identifier || !_topLevelAccountsByID.contains(*identifier)) {
    _takeIn(inserted);
  }
}

void AccountsManager::deleteAccount(const BasicAccountReference& account) {
  logToChannel("-[AccountsManager deleteAccount:]", "Deleting account: %@",
               [&] { return logArguments(propertiesToLog(account)); });
  const std::optional<Text> identifier = account ? account->identifier() : std::nullopt;
  if (identifier) {
    _removeChildrenForAccountWithIdentifier(identifier);
    _topLevelAccountsByID.remove(*identifier);
    if (const auto removed = _orderedTopLevelAccounts.removeLast(*identifier)) {
      _tell({removed->origin(), ToldFate::RemovedByDeletion});
    }
  }
}

void AccountsManager::deleteAccountWithIdentifier(std::string_view identifier) {
  const BasicAccountReference* account = _topLevelAccountsByID.find(identifier);
  deleteAccount(account != nullptr ? BasicAccountReference(*account) : nullptr);
}

void AccountsManager::replaceAccount_withAccount(const BasicAccountReference& oldAccount,
                                                 const BasicAccountReference& newAccount) {
  const std::optional<Text> oldIdentifier = oldAccount->identifier();
  // NOLINTNEXTLINE(performance-unnecessary-copy-initialization): as in updateAccount().
  const BasicAccountReference replacement = newAccount;
  _removeChildrenForAccountWithIdentifier(oldIdentifier);
  if (oldIdentifier) {
    _topLevelAccountsByID.remove(*oldIdentifier);
  }
  if (!_orderedTopLevelAccounts.replaceFirst(oldAccount, replacement)) {
    failAssertion("-[AccountsManager replaceAccount:withAccount:]", kManagerSourceFile,
                  "The account to replace is not in the store");
  }
  // Kept on purpose: the new account is not indexed by its identifier. Lookups and insertions do
  // not see it before the store is loaded again, and callers may rely on that.
  _loadChildrenFromAccount(replacement);
}

void AccountsManager::removeChildWithIdentifier_fromAccount(std::string_view identifier,
                                                            const BasicAccountReference& parent) {
  if (const std::optional<PropertyArray> children =
          parent->arrayPropertyForKey(kAccountChildAccounts)) {
    std::vector<PropertyValue> others;
    others.reserve(children->size());
    std::copy_if(children->begin(), children->end(), std::back_inserter(others),
                 [&](const PropertyValue& element) {
                   const std::optional<Text> candidate = identifierOfChildElement(element);
                   return !candidate || *candidate != identifier;
                 });
    parent->setAccountProperty_forKey(PropertyArray(std::move(others)), kAccountChildAccounts);
  }
  _loadChildrenFromAccount(parent);
}

void AccountsManager::addChild_toAccount(const BasicAccountReference& child,
                                         const BasicAccountReference& parent) {
  PropertyArray children =
      parent->arrayPropertyForKey(kAccountChildAccounts).value_or(PropertyArray());
  children.append(child->properties());
  parent->setAccountProperty_forKey(std::move(children), kAccountChildAccounts);
  _loadChildrenFromAccount(parent);
}

void AccountsManager::_removeChildrenForAccountWithIdentifier(
    const std::optional<Text>& parentIdentifier) {
  const std::vector<Text>* children =
      parentIdentifier ? _childIdentifiersByParentID.find(*parentIdentifier) : nullptr;
  if (children == nullptr) {
    return;
  }
  for (const Text& child : *children) {
    const Text* parent = _childAccountIDToParentAccountID.find(child);
    if (parent != nullptr && *parent == *parentIdentifier) {
      _childAccountIDToParentAccountID.remove(child);
      _childAccountsByID.remove(child);
    }
  }
  _childIdentifiersByParentID.remove(*parentIdentifier);
}

}  // namespace accounts
