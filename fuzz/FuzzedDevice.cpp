#include "fuzz/FuzzedDevice.h"

#include <array>
#include <set>
#include <utility>

#include "accountsettings/AccountsManager.h"
#include "fuzz/FuzzTarget.h"

namespace accounts {

namespace {

using Resources = std::map<std::string, std::optional<PropertyDictionary>, std::less<>>;

Resources readResources() {
  Resources resources;
  FakeBundleResources bundle;
  for (const std::string_view name :
       {"AccountTypesProperties", "DataclassesProperties", "AccountCreators", "MailServices"}) {
    resources.emplace(name, bundle.readPropertyList(name));
  }
  return resources;
}

/// Adds an account's identifiers to those seen. False when one of them is among them already.
bool addIdentifiers(const PropertyDictionary& account, std::set<Text>& seen) {
  constexpr std::array<std::string_view, 2> keys = {"Identifier", "uniqueId"};
  for (const std::string_view key : keys) {
    const std::optional<Text> identifier = account.textForKey(key);
    if (identifier && !seen.insert(*identifier).second) {
      return false;
    }
  }
  return true;
}

bool addIdentifiers(const PropertyArray& accounts, std::set<Text>& seen) {
  for (const PropertyValue& element : accounts) {
    const PropertyDictionary* account = element.asDictionary();
    if (account == nullptr) {
      continue;
    }
    const std::optional<PropertyArray> children = account->arrayForKey(kAccountChildAccounts);
    if (!addIdentifiers(*account, seen) || (children && !addIdentifiers(*children, seen))) {
      return false;
    }
  }
  return true;
}

}  // namespace

FuzzedDevice::FuzzedDevice() {
  static const Resources resources = readResources();
  bundleResources.replaced = resources;
  consoleLog.alsoStandardError = false;
}

void FuzzedDevice::addAnything(FuzzInput& input, std::string_view path,
                               PropertyDictionary (*make)(FuzzInput& input)) {
  constexpr std::size_t kDirectoryChoice = 7;
  const std::size_t choice = input.below(kDirectoryChoice + 1);
  if (choice == 0) {
    return;
  }
  if (choice == 1) {
    fileSystem.addFile(path, input.countedBytes());
  } else if (choice == kDirectoryChoice) {
    fileSystem.addDirectory(path);
  } else {
    addPropertyList(path, make(input));
  }
}

PropertyArray FuzzedDevice::savedAccounts() const {
  const std::optional<PropertyDictionary> file = dictionaryAt(kSettingsPath);
  require(file.has_value(), "a saved settings file reads as a dictionary");
  require(file->size() == 2, "a saved settings file holds a version and the accounts alone");
  const PropertyValue* version = file->find(kPlistVersionKey);
  require(version != nullptr && *version == PropertyValue(AccountsManager::currentVersion()),
          "a saved settings file is of the current version");
  const std::optional<PropertyArray> accounts = file->arrayForKey(kPlistAccountsKey);
  require(accounts.has_value(), "a saved settings file holds a list of accounts");
  for (const PropertyValue& element : *accounts) {
    const PropertyDictionary* account = element.asDictionary();
    require(account != nullptr, "a saved account is a dictionary");
    require(BasicAccount::_isValidAccountType(account->textForKey(kAccountType)),
            "a saved account has a known type");
    require(!account->textForKey(kAccountClass).value_or(Text()).empty(),
            "a saved account has a class");
  }
  return *accounts;
}

bool haveDistinctIdentifiers(const PropertyArray& accounts) {
  std::set<Text> seen;
  return addIdentifiers(accounts, seen);
}

}  // namespace accounts
