#include "fuzz/CarriedOver.h"

#include <algorithm>

#include "accountsettings/AccountsManager.h"
#include "accountsettings/DeviceLocalAccount.h"
#include "fuzz/FuzzTarget.h"

namespace accounts {

namespace {

constexpr std::string_view kMarkKey = "A mark that nobody knows";

/// The settings with a different mark in each account.
PropertyDictionary withMarks(PropertyDictionary settings, const PropertyArray& accounts) {
  PropertyArray marked = accounts;
  for (std::size_t index = 0; index < accounts.size(); ++index) {
    if (const PropertyDictionary* account = accounts.at(index).asDictionary()) {
      PropertyDictionary changed = *account;
      changed.set(kMarkKey, index);
      marked.replace(index, changed);
    }
  }
  settings.set(kPlistAccountsKey, marked);
  return settings;
}

/// The accounts that a store loads from a device's settings, found out on another device.
PropertyArray loadedAccounts(const FuzzedDevice& device, const PropertyDictionary& settings) {
  FuzzedDevice other;
  other.uuidGenerator.canGenerate = device.uuidGenerator.canGenerate;
  other.addPropertyList(kSettingsPath, settings);
  const Process process(other.platform);
  const std::unique_ptr<AccountsManager> store = AccountsManager::initInsideOfMigration();
  PropertyArray loaded;
  for (const BasicAccountReference& account : store->allBasicAccounts()) {
    loaded.append(account->propertiesToSave());
  }
  return loaded;
}

/// Whether settings are of no version that the upgrade chain starts at.
bool areUpToDate(const PropertyDictionary& settings) {
  const PropertyValue* version = settings.find(kPlistVersionKey);
  const std::optional<std::int64_t> number =
      version != nullptr ? version->integerValue() : std::nullopt;
  return !number || *number < 0 ||
         static_cast<std::uint64_t>(*number) >= AccountsManager::currentVersion();
}

bool isOnDevice(const PropertyDictionary& account) {
  return account.textForKey(kAccountType) == Text(kOnMyDeviceAccountType);
}

/// Whether no account has an identifier of another one, nor that of the on-device account, which a
/// migration makes anew and which takes the place of whatever has its identifier.
bool havePlainIdentifiers(const PropertyArray& accounts) {
  PropertyArray migrated{
      PropertyDictionary{{kAccountIdentifier, DeviceLocalAccount::_identifier()}}};
  for (const PropertyValue& account : accounts) {
    if (!isOnDevice(*account.asDictionary())) {
      migrated.append(account);
    }
  }
  return haveDistinctIdentifiers(accounts) && haveDistinctIdentifiers(migrated);
}

/// Two steps take accounts away: one makes the on-device account anew, the other folds calendars
/// into the mail accounts that they belong to.
bool canBeTakenAway(const PropertyDictionary& account) {
  return isOnDevice(account) || account.textForKey(kAccountClass) == Text("MobileCalDAVAccount");
}

/// The marks of accounts and of their children.
void collectMarks(const PropertyArray& accounts, std::vector<PropertyValue>& marks) {
  for (const PropertyValue& element : accounts) {
    if (const PropertyDictionary* account = element.asDictionary()) {
      if (const PropertyValue* mark = account->find(kMarkKey)) {
        marks.push_back(*mark);
      }
      collectMarks(account->arrayForKey(kAccountChildAccounts).value_or(PropertyArray()), marks);
    }
  }
}

}  // namespace

CarriedOver::CarriedOver(FuzzedDevice& device) {
  const std::optional<PropertyDictionary> settings = device.dictionaryAt(kSettingsPath);
  const std::optional<PropertyArray> accounts =
      settings ? settings->arrayForKey(kPlistAccountsKey) : std::nullopt;
  if (!accounts || device.has(kSentinelPath) || device.has(kLegacyMailPath) ||
      device.has(kLegacyExchangePath)) {
    return;
  }
  const PropertyDictionary marked = withMarks(*settings, *accounts);
  accounts_ = loadedAccounts(device, marked);
  isPlain_ = havePlainIdentifiers(accounts_);
  isUpToDate_ = areUpToDate(*settings);
  for (const PropertyValue& account : accounts_) {
    if (!canBeTakenAway(*account.asDictionary())) {
      marks_.push_back(*account.asDictionary()->find(kMarkKey));
    }
  }
  device.addPropertyList(kSettingsPath, marked);
}

void CarriedOver::checkAfterMigration(const FuzzedDevice& device) const {
  if (!isPlain_) {
    return;
  }
  const PropertyArray saved = device.savedAccounts();
  if (isUpToDate_) {
    requireEqual(saved, accounts_, "accounts of the current version are left as they are");
    return;
  }
  std::vector<PropertyValue> found;
  collectMarks(saved, found);
  for (const PropertyValue& mark : marks_) {
    require(std::ranges::find(found, mark) != found.end(), "no account is lost");
  }
}

}  // namespace accounts
