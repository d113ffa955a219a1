#include "fuzz/StoreChanges.h"

#include <array>

#include "fuzz/AccountValues.h"
#include "fuzz/AnyValue.h"

namespace accounts {

namespace {

constexpr std::size_t kMostChanges = 16;

/// What a change works on.
struct Changing {
  FuzzInput& input;
  FuzzedDevice& device;
  AccountsManager& store;

  /// An account of the store, null when it has none.
  [[nodiscard]] BasicAccountReference anAccount() const {
    const AccountsManager::Accounts all = store.allBasicSyncableAccounts();
    return all.empty() ? nullptr : all[input.below(all.size())];
  }
  /// A top-level account, null when there is none.
  [[nodiscard]] BasicAccountReference aTopLevelAccount() const {
    const AccountsManager::Accounts& all = store.allBasicAccounts();
    return all.empty() ? nullptr : all[input.below(all.size())];
  }
  /// A new record, null when its dictionary is not accepted.
  [[nodiscard]] BasicAccountReference aNewAccount() const {
    return BasicAccount::initWithProperties(accountFrom(input));
  }
};

void insert(Changing& changing) {
  if (const BasicAccountReference account = changing.aNewAccount()) {
    changing.store.insertAccount(account);
  }
}
void remove(Changing& changing) {
  changing.store.deleteAccount(changing.anAccount());
}
void removeByIdentifier(Changing& changing) {
  changing.store.deleteAccountWithIdentifier(anyText(changing.input));
}
void update(Changing& changing) {
  if (const BasicAccountReference account = changing.aNewAccount()) {
    changing.store.updateAccount(account);
  }
}
void replace(Changing& changing) {
  const BasicAccountReference old = changing.aTopLevelAccount();
  const BasicAccountReference account = changing.aNewAccount();
  if (old && account) {
    changing.store.replaceAccount_withAccount(old, account);
  }
}
void replaceTypes(Changing& changing) {
  const Text type = typeFrom(changing.input);
  const Text otherType = typeFrom(changing.input);
  AccountsManager::Accounts accounts;
  for (std::size_t count = changing.input.below(4); count > 0; --count) {
    const BasicAccountReference account =
        changing.input.flag() ? changing.anAccount() : changing.aNewAccount();
    if (account) {
      accounts.push_back(account);
    }
  }
  changing.store.replaceAccountsWithTypes_withAccounts({type, otherType}, accounts);
}
void addChild(Changing& changing) {
  const BasicAccountReference parent = changing.aTopLevelAccount();
  const BasicAccountReference child = changing.aNewAccount();
  if (parent && child) {
    child->setParentAccount(parent);
    changing.store.addChild_toAccount(child, parent);
  }
}
void removeChild(Changing& changing) {
  if (const BasicAccountReference parent = changing.aTopLevelAccount()) {
    changing.store.removeChildWithIdentifier_fromAccount(anyText(changing.input), parent);
  }
}
void switchDataclass(Changing& changing) {
  if (const BasicAccountReference account = changing.anAccount()) {
    const bool enabled = changing.input.flag();
    account->setEnabled_forDataclass(enabled, dataclassFrom(changing.input));
  }
}
void setProperty(Changing& changing) {
  if (const BasicAccountReference account = changing.anAccount()) {
    const Text key = anyText(changing.input);
    account->setAccountProperty_forKey(anyValue(changing.input), key);
  }
}
void takeProperties(Changing& changing) {
  const BasicAccountReference account = changing.anAccount();
  for (const auto& [key, value] : accountFrom(changing.input)) {
    if (account) {
      account->setAccountProperty_forKey(value, key);
    }
  }
}
void writeAsAnotherProgram(Changing& changing) {
  changing.device.addPropertyList(kSettingsPath, settingsFrom(changing.input));
}
void save(Changing& changing) {
  changing.store.saveAllAccounts();
}

}  // namespace

void changeStore(FuzzInput& input, FuzzedDevice& device, AccountsManager& store) {
  constexpr std::array kChanges = {
      insert,   remove,      removeByIdentifier, update,      replace,        replaceTypes,
      addChild, removeChild, switchDataclass,    setProperty, takeProperties, writeAsAnotherProgram,
      save};
  Changing changing = {input, device, store};
  for (std::size_t count = 0; count < kMostChanges && !input.isUsedUp(); ++count) {
    kChanges[input.below(kChanges.size())](changing);
  }
}

}  // namespace accounts
