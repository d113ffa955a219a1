#include <algorithm>

#include "accountsettings/AccountsManager.h"
#include "accountsettings/DeviceLocalAccount.h"
#include "accountsettings/Log.h"

namespace accounts {

namespace {

constexpr std::string_view kFullDeviceLocalAccountOperation =
    "-[AccountsManager fullDeviceLocalAccount]";
constexpr std::string_view kAccountsWithTypesOperation =
    "-[AccountsManager accountsWithTypes:withLoader:]";

bool isOneOf(const AccountsManager::Types& types, const std::optional<Text>& type) {
  return type && std::find(types.begin(), types.end(), type->view()) != types.end();
}

}  // namespace

FullAccountReference AccountsManager::fullDeviceLocalAccount() {
  for (const BasicAccountReference& account : allBasicAccounts()) {
    if (account->type() == kOnMyDeviceAccountType) {
      return account->fullAccountUsingLoader(nullptr);
    }
  }
  logToChannel(kFullDeviceLocalAccountOperation, "DeviceLocalAccount missing. Creating...");
  const BasicAccountReference account =
      BasicAccount::initWithProperties(DeviceLocalAccount::basicAccountProperties());
  replaceAccountsWithTypes_withAccounts({kOnMyDeviceAccountType}, {account});
  return account->fullAccountUsingLoader(nullptr);
}

FullAccountReference AccountsManager::fullAccountWithIdentifier_loader(
    std::optional<std::string_view> identifier, FullAccountLoader* loader) const {
  if (!identifier || identifier->empty()) {
    return nullptr;
  }
  const BasicAccountReference* account = _topLevelAccountsByID.find(*identifier);
  if (account == nullptr) {
    account = _childAccountsByID.find(*identifier);
  }
  return account != nullptr ? (*account)->fullAccountUsingLoader(loader) : nullptr;
}

std::vector<FullAccountReference> AccountsManager::accountsWithTypes(const Types& types) const {
  return accountsWithTypes_withLoader(types, nullptr);
}

std::vector<FullAccountReference> AccountsManager::accountsWithTypes_withLoader(
    const Types& types, FullAccountLoader* loader) const {
  std::vector<FullAccountReference> fullAccounts;
  for (const BasicAccountReference& account : allBasicAccounts()) {
    const std::optional<Text> identifier = account->identifier();
    if (isOneOf(types, account->type())) {
      FullAccountReference fullAccount = fullAccountWithIdentifier_loader(identifier, loader);
      if (fullAccount == nullptr) {
        failAssertion(kAccountsWithTypesOperation, kManagerSourceFile,
                      "The account with id %@ has no full account", {identifier});
      }
      fullAccounts.push_back(std::move(fullAccount));
    }
    const std::vector<Text>* children =
        identifier ? _childIdentifiersByParentID.find(*identifier) : nullptr;
    if (children == nullptr) {
      continue;
    }
    for (const Text& childIdentifier : *children) {
      const BasicAccountReference* child = _childAccountsByID.find(childIdentifier);
      if (child != nullptr && (*child)->parentAccount() == account &&
          isOneOf(types, (*child)->type())) {
        fullAccounts.push_back((*child)->fullAccountUsingLoader(loader));
      }
    }
  }
  return fullAccounts;
}

std::vector<FullAccountReference> AccountsManager::allMailAccounts() const {
  return accountsWithTypes(
      {kMailAccountType, kVelmoraAccountType, kGmailAccountType, kYahooAccountType});
}

}  // namespace accounts
