#include <algorithm>
#include <unordered_set>
#include <utility>

#include "accountsettings/AccountsManager.h"
#include "accountsettings/ChildPlacement.h"
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
      kept.push_back(*newAccount);
      replacement.placed.insert(newAccount->get());
    } else if (!type || std::find(types.begin(), types.end(), type->view()) == types.end()) {
      kept.push_back(account);
    } else {
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
  _loadChildrenOfPlacedAccounts(replacement);
}

void AccountsManager::_loadChildrenOfPlacedAccounts(const Replacement& replacement) {
  // An account that took several places counts where the walk met it last, in the first of them.
  Accounts placed;
  std::unordered_set<const BasicAccount*> seen;
  for (const BasicAccountReference& account : replacement.orderedAccounts) {
    if (replacement.placed.contains(account.get()) && seen.insert(account.get()).second) {
      placed.push_back(account);
    }
  }
  for (std::size_t index = placed.size(); index-- > 0;) {
    _loadChildrenFromAccount(placed[index]);
  }
}

void AccountsManager::_addRemainingAccounts(const Accounts& accounts, Replacement& replacement) {
  ChildPlacement placement(_childAccountIDToParentAccountID, replacement.accountsByID);
  for (const BasicAccountReference& account : accounts) {
    if (replacement.placed.contains(account.get())) {
      continue;
    }
    if (account->parentAccountIdentifier()) {
      placement.place(*account);
      continue;
    }
    replacement.orderedAccounts.push_back(account);
    if (const std::optional<Text> identifier = account->identifierProperty()) {
      replacement.accountsByID.set(*identifier, account);
    }
    placement.indexChildrenOf(account);
  }
  const ChildPlacement::IndexingToDo toDo = placement.finish();
  for (const BasicAccountReference& parent : toDo.parents) {
    _loadChildrenFromAccount(parent);
  }
  for (const Text& child : toDo.lostChildren) {
    _childAccountsByID.remove(child);
    _childAccountIDToParentAccountID.remove(child);
  }
}

}  // namespace accounts
