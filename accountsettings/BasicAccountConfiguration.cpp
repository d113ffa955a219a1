#include <algorithm>
#include <vector>

#include "accountsettings/BasicAccount.h"
#include "accountsettings/Log.h"
#include "accountsettings/Process.h"
#include "vocabulary/DeviceServices.h"

namespace accounts {

namespace {

constexpr std::string_view kAccountTypesResource = "AccountTypesProperties";
constexpr std::string_view kDataclassesResource = "DataclassesProperties";

/// The dataclasses of a type's configured list that this system knows and the device can offer.
PropertyArray normalisedDataclasses(const PropertyArray& configured, bool isMultitaskingEnabled) {
  const PropertyArray& known = BasicAccount::allSupportedDataclasses();
  PropertyArray normalised;
  for (const PropertyValue& dataclass : configured) {
    const auto* place = std::find(known.begin(), known.end(), dataclass);
    if (place != known.end() &&
        (isMultitaskingEnabled || *place->asText() != kAccountDataclassNotes)) {
      normalised.append(*place);
    }
  }
  return normalised;
}

PropertyDictionary loadAccountTypesTable() {
  static constexpr std::string_view kOperation = "+[BasicAccount initialize]";
  BundleResources& resources = Process::current().platform.bundleResources;
  if (!resources.hasPropertyList(kAccountTypesResource)) {
    failAssertion(kOperation, kAccountSourceFile, "Could not find AccountTypesProperties.plist");
  }
  const std::optional<PropertyDictionary> file = resources.readPropertyList(kAccountTypesResource);
  if (!file) {
    // Kept on purpose: the message names the dataclasses although the account types failed; log
    // searches know it so.
    failAssertion(kOperation, kAccountSourceFile,
                  "Could not load the dataclasses configuration file");
  }
  const bool isMultitaskingEnabled = BasicAccount::isMultitaskingEnabled();
  std::vector<KeyedValue> table;
  table.reserve(file->size());
  for (const auto& [type, configured] : *file) {
    PropertyValue& stored = table.emplace_back(KeyedValue{type, configured}).value;
    const PropertyDictionary* properties = configured.asDictionary();
    if (properties == nullptr) {
      continue;
    }
    const PropertyArray dataclasses = normalisedDataclasses(
        properties->arrayForKey(kPropertiesSupportedDataclasses).value_or(PropertyArray()),
        isMultitaskingEnabled);
    // Kept on purpose: a type of which nothing is left keeps its list as it stands in the file.
    if (!dataclasses.empty()) {
      PropertyDictionary normalised = *properties;
      normalised.set(kPropertiesSupportedDataclasses, dataclasses);
      stored = normalised;
    }
  }
  return PropertyDictionary(std::move(table));
}

const PropertyDictionary& accountTypesTable() {
  return Process::current().accountTypesTable.get(loadAccountTypesTable);
}

std::optional<PropertyArray> arrayOfType(std::string_view type, std::string_view key) {
  const std::optional<PropertyDictionary> properties = accountTypesTable().dictionaryForKey(type);
  return properties ? properties->arrayForKey(key) : std::nullopt;
}

bool booleanOfEntry(const PropertyDictionary& table, std::string_view entry, std::string_view key) {
  const std::optional<PropertyDictionary> properties = table.dictionaryForKey(entry);
  const PropertyValue* value = properties ? properties->find(key) : nullptr;
  return value != nullptr && value->booleanValue().value_or(false);
}

bool booleanOfDataclass(std::string_view dataclass, std::string_view key) {
  const std::optional<PropertyDictionary>& table =
      Process::current().dataclassesTable.get(BasicAccount::_dataclassesProperties);
  return table && booleanOfEntry(*table, dataclass, key);
}

std::optional<PropertyArray> toggleActions(std::string_view dataclass, std::string_view type,
                                           std::string_view key) {
  const std::optional<PropertyArray> actions = arrayOfType(type, key);
  if (!actions || BasicAccount::multipleStoresSupportedByDataclass(dataclass)) {
    return actions;
  }
  return BasicAccount::removeActionsIncompatibleWithSingleStoreDataclass(*actions);
}

}  // namespace

void BasicAccount::initialize() {
  accountTypesTable();
}

bool BasicAccount::isMultitaskingEnabled() {
  const std::optional<PropertyValue> architecture =
      Process::current().platform.deviceInfoService.copyAnswer(kArchitectureQuestion);
  return architecture != PropertyValue(kArchitectureWithoutMultitasking);
}

const PropertyArray& BasicAccount::allSupportedDataclasses() {
  return Process::current().canonicalDataclasses.get([] {
    return PropertyArray{kAccountDataclassMail,           kAccountDataclassContacts,
                         kAccountDataclassCalendars,      kAccountDataclassReminders,
                         kAccountDataclassBookmarks,      kAccountDataclassNotes,
                         kAccountDataclassMediaStream,    kAccountDataclassDeviceLocator,
                         kAccountDataclassContactsSearch, kAccountDataclassBackup,
                         kAccountDataclassUbiquity,       kAccountDataclassKeyValue,
                         kAccountDataclassShoebox,        kAccountDataclassSharedStreams};
  });
}

std::optional<PropertyArray> BasicAccount::supportedDataclassesForAccountType(
    std::string_view type) {
  return arrayOfType(type, kPropertiesSupportedDataclasses);
}

std::vector<Text> BasicAccount::knownAccountTypes() {
  std::vector<Text> types;
  for (const PropertyEntry& entry : accountTypesTable()) {
    types.push_back(entry.key);
  }
  return types;
}

std::optional<PropertyArray> BasicAccount::userActionsToEnableDataclass_forAccountType(
    std::string_view dataclass, std::string_view type) {
  return toggleActions(dataclass, type, kPropertiesEnableDataclassActions);
}

std::optional<PropertyArray> BasicAccount::userActionsToDisableDataclass_forAccountType(
    std::string_view dataclass, std::string_view type) {
  return toggleActions(dataclass, type, kPropertiesDisableDataclassActions);
}

PropertyArray BasicAccount::removeActionsIncompatibleWithSingleStoreDataclass(
    const PropertyArray& actions) {
  std::vector<PropertyValue> compatible(actions.begin(), actions.end());
  const auto last = std::find(compatible.rbegin(), compatible.rend(),
                              PropertyValue(kDataclassToggleActionKeepLocalData));
  if (last != compatible.rend()) {
    compatible.erase(std::next(last).base());
  }
  return PropertyArray(std::move(compatible));
}

std::optional<PropertyArray> BasicAccount::deleteAccountActionsForAccountType(
    std::string_view type) {
  return arrayOfType(type, kPropertiesDeleteAccountActions);
}

bool BasicAccount::showRemindersSeparatelyForAccountType(std::string_view type) {
  return booleanOfEntry(accountTypesTable(), type, kPropertiesShowRemindersSeparately);
}

bool BasicAccount::multipleStoresSupportedByDataclass(std::string_view dataclass) {
  return booleanOfDataclass(dataclass, kDataclassSupportsMultipleStores);
}

bool BasicAccount::displayToggleForDataclass(std::string_view dataclass) {
  return booleanOfDataclass(dataclass, kDataclassDisplaySwitch);
}

bool BasicAccount::userConfirmationIsRequiredByDataclass(std::string_view dataclass) {
  return booleanOfDataclass(dataclass, kDataclassRequiresUserConfirmation);
}

bool BasicAccount::_isValidAccountType(std::optional<std::string_view> type) {
  return type && !type->empty() && accountTypesTable().contains(*type);
}

std::optional<PropertyDictionary> BasicAccount::_dataclassesProperties() {
  return Process::current().platform.bundleResources.readPropertyList(kDataclassesResource);
}

}  // namespace accounts
