#include <algorithm>
#include <unordered_set>
#include <utility>

#include "accountsettings/AccountsManager.h"
#include "accountsettings/Log.h"

namespace accounts {

struct AccountsManager::Replacement {
  Accounts orderedAccounts;
  IdentifierIndex<BasicAccountReference> accountsByID;
  /// The new accounts that took the places of others.
  std::unordered_set<const BasicAccount*> placed;
};

void AccountsManager::replaceAccountsWithTypes_withAccounts(const Types& types,
                                                            const Accounts& accounts) {
  logToChannel("-[AccountsManager replaceAccountsWithTypes:withAccounts:]", "Replacing accounts");
  Replacement replacement;
  replacement.accountsByID.reserve(_orderedTopLevelAccounts.size());
  _keepOrReplaceAccounts(types, accounts, replacement);
  _addRemainingAccounts(accounts, replacement);
  _topLevelAccountsByID = std::move(replacement.accountsByID);
  // Another index counts its changes anew, so the counts do not tell that it is another one.
  _accountsBySyncIDStamp.reset();
  _orderedTopLevelAccounts.assign(std::move(replacement.orderedAccounts));
}

void AccountsManager::_keepOrReplaceAccounts(const Types& types, const Accounts& accounts,
                                             Replacement& replacement) {
  IdentifierIndex<BasicAccountReference> newAccountsByID;
  for (const BasicAccountReference& account : accounts) {
    if (const std::optional<Text> identifier = account->identifierProperty()) {
      newAccountsByID.set(*identifier, account);
    }
  }
  Accounts& kept = replacement.orderedAccounts;
  const Accounts& present = _orderedTopLevelAccounts.accounts();
  for (std::size_t index = present.size(); index-- > 0;) {
    const BasicAccountReference& account = present[index];
    // The property, not the record's own answer: a record may answer otherwise.
    const std::optional<Text> identifier = account->identifierProperty();
    const BasicAccountReference* newAccount =
        identifier ? newAccountsByID.find(*identifier) : nullptr;
    const std::optional<Text> type = account->type();
    if (newAccount != nullptr) {
      if (*newAccount != account) {
        _tell({account->origin(), ToldFate::Overwritten, (*newAccount)->origin()});
      }
      kept.push_back(*newAccount);
      replacement.placed.insert(newAccount->get());
      // Again in each place that the account takes: the lines about its children say so.
      _loadChildrenFromAccount(*newAccount);
    } else if (!type || std::find(types.begin(), types.end(), type->view()) == types.end()) {
      kept.push_back(account);
    } else {
      _tell({account->origin(), ToldFate::RemovedByReplacement});
      _removeChildrenForAccountWithIdentifier(identifier);
    }
  }
  std::reverse(kept.begin(), kept.end());
  for (const BasicAccountReference& account : kept) {
    // The walk ends with the first account: of several with one identifier it is the one to find.
    const std::optional<Text> identifier = account->identifierProperty();
    if (identifier) {
      BasicAccountReference& found = replacement.accountsByID[*identifier];
      found = found != nullptr ? found : account;
    }
  }
}

void AccountsManager::_addRemainingAccounts(const Accounts& accounts, Replacement& replacement) {
  for (const BasicAccountReference& account : accounts) {
    if (replacement.placed.contains(account.get())) {
      continue;
    }
    if (account->parentAccountIdentifier()) {
      _moveChild(account, replacement.accountsByID);
      continue;
    }
    replacement.orderedAccounts.push_back(account);
    if (const std::optional<Text> identifier = account->identifierProperty()) {
      replacement.accountsByID.set(*identifier, account);
    }
    _loadChildrenFromAccount(account);
  }
}

void AccountsManager::_moveChild(const BasicAccountReference& child,
                                 const IdentifierIndex<BasicAccountReference>& parents) {
  const BasicAccountReference* parent = parents.find(*child->parentAccountIdentifier());
  const std::optional<Text> identifier = child->identifier();
  const Text* presentParentIdentifier =
      identifier ? _childAccountIDToParentAccountID.find(*identifier) : nullptr;
  if (presentParentIdentifier != nullptr) {
    const bool stays = parent != nullptr && (*parent)->identifier() == *presentParentIdentifier;
    const BasicAccountReference* presentParent =
        stays ? parent : parents.find(*presentParentIdentifier);
    if (presentParent != nullptr) {
      removeChildWithIdentifier_fromAccount(*identifier, *presentParent);
    }
  }
  if (parent != nullptr) {
    addChild_toAccount(child, *parent);
  }
}

}  // namespace accounts
