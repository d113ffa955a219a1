#include <array>

#include "accountsettings/Log.h"
#include "accountsettings/Process.h"
#include "migrator/AccountsDataMigrator.h"
#include "migrator/LegacyDescriptions.h"
#include "vocabulary/LegacyStoreKeys.h"

namespace accounts {

namespace {

constexpr std::string_view kExchangeConversionOperation =
    "-[AccountsDataMigrator(Internal) _migrateDAAccounts:]";
constexpr std::string_view kExchangeTypeString = "Exchange";

const std::array<LegacyKey, 3> kExchangeKeys = {{
    {kLegacyExchangeClass, kAccountClass},
    {kLegacyExchangeDisplayName, kAccountDisplayName},
    {kLegacyExchangeIdentifier, kAccountIdentifier},
}};

/// A boolean of a legacy description and the dataclass that it switches.
struct DataclassSwitch {
  std::string_view legacyKey;
  std::string_view dataclass;
};

const std::array<DataclassSwitch, 4> kDataclassSwitches = {{
    {kLegacyExchangeSwitches[0], kAccountDataclassCalendars},
    {kLegacyExchangeSwitches[1], kAccountDataclassContacts},
    {kLegacyExchangeSwitches[2], kAccountDataclassMail},
    {kLegacyExchangeSwitches[3], kAccountDataclassContactsSearch},
}};

/// Takes the legacy switches out of a description. A dataclass is on unless its switch says no.
PropertyArray takeEnabledDataclasses(PropertyDictionary& description) {
  PropertyArray enabled;
  for (const DataclassSwitch& dataclassSwitch : kDataclassSwitches) {
    const std::optional<PropertyValue> value = description.take(dataclassSwitch.legacyKey);
    if (!value || value->booleanValue().value_or(true)) {
      enabled.append(dataclassSwitch.dataclass);
    }
  }
  return enabled;
}

}  // namespace

PropertyDictionary accountPropertiesOfExchangeDescription(const PropertyDictionary& description) {
  PropertyDictionary properties = description;
  moveLegacyKeys(properties, kExchangeKeys);
  properties.set(kAccountEnabledDataclasses, takeEnabledDataclasses(properties));
  properties.set(kAccountType, kExchangeAccountType);
  properties.set(kAccountTypeString, kExchangeTypeString);
  properties.set(kAccountShortTypeString, kExchangeTypeString);
  return properties;
}

bool AccountsDataMigrator::_migrateDAAccounts(AccountsManager& store) {
  const std::string path = daAccountPath();
  const std::optional<PropertyDictionary> file =
      Process::current().platform.propertyLists.readDictionary(path);
  const PropertyDictionary legacyAccounts = file.value_or(PropertyDictionary());
  if (!legacyAccounts.empty()) {
    _foundOldDAAccountsToMigrate = true;
  }
  collect(kInformationOldExchangeAccounts, file);

  const std::optional<AccountsManager::Accounts> converted = convertDescriptions(
      AccountOrigin::Kind::Exchange,
      legacyAccounts.arrayForKey(kLegacyExchangeAccounts).value_or(PropertyArray()),
      kExchangeConversionOperation,
      "%s. Could not convert the description for the Exchange account %@",
      [this](const PropertyDictionary& description) {
        return _convertExchangeAccountDescription(description);
      });
  if (converted) {
    store.replaceAccountsWithTypes_withAccounts({kExchangeAccountType}, *converted);
  }
  removeOriginalBeside(path);
  return converted.has_value();
}

BasicAccountReference AccountsDataMigrator::_convertExchangeAccountDescription(
    const PropertyDictionary& description) {
  const PropertyDictionary properties = accountPropertiesOfExchangeDescription(description);
  BasicAccountReference record = BasicAccount::initWithProperties(properties);
  if (record == nullptr) {
    return nullptr;
  }
  // Kept on purpose: unlike a mail account, an Exchange account without an identifier is given no
  // sync identifier here; the record's own initialiser decides.
  if (const std::optional<Text> identifier = properties.textForKey(kAccountIdentifier)) {
    record->setAccountProperty_forKey(*identifier, kAccountSyncIdentifier);
  }
  return record;
}

}  // namespace accounts
