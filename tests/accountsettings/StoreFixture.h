#pragma once

#include <gtest/gtest.h>

#include <algorithm>
#include <memory>
#include <optional>
#include <string>
#include <string_view>
#include <utility>
#include <vector>

#include "accountsettings/AccountsManager.h"
#include "tests/fakes/FakePlatform.h"
#include "tests/fakes/StoreContents.h"

namespace accounts {

/// A record made from a dictionary.
inline BasicAccountReference recordOf(const PropertyDictionary& account) {
  return BasicAccount::initWithProperties(account);
}

inline AccountDictionary mail(std::string_view identifier) {
  return anAccount(identifier, kMailAccountType, "IMAPAccount");
}
inline AccountDictionary exchange(std::string_view identifier) {
  return anAccount(identifier, kExchangeAccountType, "MobileExchangeAccount");
}
inline AccountDictionary calDAV(std::string_view identifier) {
  return anAccount(identifier, kCalDAVAccountType, "MobileCalDAVAccount");
}
inline AccountDictionary onMyDevice(std::string_view identifier) {
  return anAccount(identifier, kOnMyDeviceAccountType, "DeviceLocalAccount");
}
inline AccountDictionary ofUnknownType(std::string_view identifier) {
  return anAccount(identifier, "Carrier Pigeon", "PigeonAccount");
}
/// A mail account whose class the mail fixer cannot work out.
inline AccountDictionary mailThatCannotBeFixed(std::string_view identifier) {
  return anAccount(identifier, kMailAccountType, "BrokenAccount");
}
/// A mail account whose class the mail fixer works out.
inline AccountDictionary mailThatCanBeFixed(std::string_view identifier) {
  return mailThatCannotBeFixed(identifier).with("AccountPath", "/Library/Mail/POP-somewhere");
}

/// The identifiers of accounts as one text, such as "A B"; "-" for an account without one.
inline std::string identifiersOf(const AccountsManager::Accounts& accounts) {
  std::string identifiers;
  for (const BasicAccountReference& account : accounts) {
    identifiers += identifiers.empty() ? "" : " ";
    identifiers += account->identifier().value_or("-").view();
  }
  return identifiers;
}

/// The same for the elements of an array of account dictionaries.
inline std::string identifiersOf(const PropertyArray& elements) {
  std::string identifiers;
  for (const PropertyValue& element : elements) {
    identifiers += identifiers.empty() ? "" : " ";
    identifiers += element.asDictionary()->textForKey(kAccountIdentifier).value_or("-").view();
  }
  return identifiers;
}

/// A fake device on which stores are made.
class StoreFixture : public testing::Test {
 protected:
  using Store = std::unique_ptr<AccountsManager>;
  using Lines = std::vector<std::string>;

  /// A store of these account dictionaries.
  static Store storeOf(std::vector<PropertyValue> accounts) {
    return AccountsManager::initWithAccounsInfoArray(PropertyArray(std::move(accounts)));
  }

  /// Writes the account settings file as some other program would.
  void writeSettings(std::vector<PropertyValue> accounts, PropertyValue version = 12) {
    device.addPropertyList(
        kSettingsPath, PropertyDictionary{{kPlistAccountsKey, PropertyArray(std::move(accounts))},
                                          {kPlistVersionKey, std::move(version)}});
  }

  /// A store with the accounts that this puts into the account settings file.
  Store storeFromFileOf(std::vector<PropertyValue> accounts, PropertyValue version = 12) {
    writeSettings(std::move(accounts), std::move(version));
    return AccountsManager::initInsideOfMigration();
  }

  [[nodiscard]] PropertyDictionary settings() const {
    return device.dictionaryAt(kSettingsPath).value_or(PropertyDictionary());
  }
  /// The account dictionaries in the account settings file.
  [[nodiscard]] PropertyArray settingsAccounts() const {
    return settings().arrayForKey(kPlistAccountsKey).value_or(PropertyArray());
  }
  /// The account dictionary at a place of the account settings file.
  [[nodiscard]] PropertyDictionary settingsAccount(std::size_t place) const {
    return *settingsAccounts().at(place).asDictionary();
  }

  /// The identifiers of the indexed children, in order.
  static std::string childrenOf(const AccountsManager& store) {
    AccountsManager::Accounts all = store.allBasicSyncableAccounts();
    all.erase(all.begin(), all.begin() + static_cast<std::ptrdiff_t>(store.count()));
    return identifiersOf(all);
  }

  /// The lines of the log channel so far, with "N" in the place of the source line; then none.
  Lines takeLines() {
    Lines lines = device.logSystem.channel.linesWithoutNumbers();
    device.logSystem.channel.lines.clear();
    return lines;
  }
  /// Those of them that an operation wrote.
  Lines takeLinesOf(std::string_view operation) {
    Lines lines = takeLines();
    std::erase_if(lines, [&](const std::string& line) { return !line.starts_with(operation); });
    return lines;
  }

  FakeProcess device;
};

}  // namespace accounts
