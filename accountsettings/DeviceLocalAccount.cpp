#include "accountsettings/DeviceLocalAccount.h"

#include <algorithm>
#include <array>

#include "accountsettings/Process.h"
#include "vocabulary/AccountClasses.h"

namespace accounts {

namespace {

constexpr std::string_view kStringTable = "DeviceLocalAccount";
constexpr std::string_view kDeviceClassQuestion = "DeviceClass";
constexpr std::string_view kDefaultDeviceClass = "Handra";

// The sources that data may be synced with over a cable. Whatever else the pairing service answers
// is passed on, and counts as the device itself wherever a text is chosen.
constexpr std::string_view kDorsaSource = "Veskar";
constexpr std::string_view kWindowsSource = "Windows";
constexpr std::string_view kNoSource = "Handra";

constexpr std::string_view kTetheredSyncDomain = "com.quarx.mobile.tethered_sync";
constexpr std::string_view kSyncingSystemKey = "SyncingOS";

constexpr std::string_view kOnMyDevicePrefix = "ON_MY_DEVICE_TYPE";

/// The keys of the texts that name a source in one kind of sentence. The key for the device itself
/// is a prefix, to which the kind of device is added.
struct SourceTexts {
  std::string_view dorsaKey;
  std::string_view windowsKey;
  std::string_view devicePrefix;
};

constexpr SourceTexts kTextsAtBeginningOfSentence = {"FROM_MY_COMPUTER_TYPE_DORSA",
                                                     "FROM_MY_COMPUTER_TYPE_PC", kOnMyDevicePrefix};
constexpr SourceTexts kTextsInMidSentence = {"FROM_MY_COMPUTER_TYPE_DORSA_MID_SENTENCE",
                                             "FROM_MY_COMPUTER_TYPE_PC_MID_SENTENCE",
                                             "ON_MY_DEVICE_TYPE_MID_SENTENCE"};
constexpr SourceTexts kTextsOfReference = {"SYNCED_WITH_YOUR_COMPUTER_TYPE_DORSA_MID_SENTENCE",
                                           "SYNCED_WITH_YOUR_COMPUTER_TYPE_PC_MID_SENTENCE",
                                           "ON_YOUR_DEVICE_TYPE_MID_SENTENCE"};

/// The key of a dataclass in the tethered-sync domain; none for a dataclass that has none.
std::optional<std::string_view> tetheredSyncKey(std::string_view dataclass) {
  struct Row {
    std::string_view dataclass;
    std::string_view key;
  };
  static const std::array<Row, 6> rows = {{
      {kAccountDataclassMail, "Mail Accounts"},
      {kAccountDataclassContacts, "Contacts"},
      {kAccountDataclassCalendars, "Calendars"},
      // Reminders come from the computer together with the calendars.
      {kAccountDataclassReminders, "Calendars"},
      {kAccountDataclassBookmarks, "Bookmarks"},
      {kAccountDataclassNotes, "Notes"},
  }};
  const auto* row = std::find_if(rows.begin(), rows.end(), [&](const Row& candidate) {
    return candidate.dataclass == dataclass;
  });
  return row != rows.end() ? std::optional(row->key) : std::nullopt;
}

char asciiUpperCase(char character) {
  return character >= 'a' && character <= 'z' ? static_cast<char>(character - 'a' + 'A')
                                              : character;
}

std::string localized(std::string_view key) {
  return Process::current().platform.localizedStrings.localizedString(key, "", kStringTable);
}

/// The localised text that belongs to a prefix on this kind of device.
std::string deviceSpecificString(std::string_view prefix) {
  const std::optional<PropertyValue> answer =
      Process::current().platform.deviceInfoService.copyAnswer(kDeviceClassQuestion);
  const Text* answeredClass = answer ? answer->asText() : nullptr;
  std::string deviceClass(answeredClass != nullptr ? answeredClass->view() : kDefaultDeviceClass);
  std::transform(deviceClass.begin(), deviceClass.end(), deviceClass.begin(), asciiUpperCase);
  std::replace(deviceClass.begin(), deviceClass.end(), ' ', '_');
  return localized(std::string(prefix) + "_" + deviceClass);
}

std::string textForSource(std::string_view source, const SourceTexts& texts) {
  if (source == kDorsaSource) {
    return localized(texts.dorsaKey);
  }
  if (source == kWindowsSource) {
    return localized(texts.windowsKey);
  }
  return deviceSpecificString(texts.devicePrefix);
}

}  // namespace

std::shared_ptr<DeviceLocalAccount> DeviceLocalAccount::initWithProperties(
    const PropertyDictionary& properties) {
  std::shared_ptr<DeviceLocalAccount> account(new DeviceLocalAccount());
  return account->acceptProperties(properties) ? account : nullptr;
}

std::shared_ptr<DeviceLocalAccount> DeviceLocalAccount::accountWithProperties(
    const PropertyDictionary& properties) {
  return initWithProperties(properties);
}

void DeviceLocalAccount::registerClass(ClassRegistry& registry) {
  AccountClass accountClass;
  accountClass.accountWithBasicAccount = [](const AccountRecordReference& record) {
    return accountWithBasicAccount(*record);
  };
  registry.registerClass(std::string(_identifier()), std::move(accountClass));
}

std::shared_ptr<DeviceLocalAccount> DeviceLocalAccount::accountWithBasicAccount(
    const AccountRecord& record) {
  return initWithProperties(record.properties());
}

void DeviceLocalAccount::setParentAccount(AccountRecordReference parent) {
  setParentAccount(std::dynamic_pointer_cast<BasicAccount>(parent));
}

std::optional<Text> DeviceLocalAccount::identifier() const {
  return Text(_identifier());
}

std::optional<Text> DeviceLocalAccount::syncStoreIdentifier() const {
  return identifier();
}

std::optional<Text> DeviceLocalAccount::displayName() const {
  return Text(typeString());
}

PropertyDictionary DeviceLocalAccount::basicAccountProperties() {
  const Text nameOfType = typeString();
  return {{kAccountType, kOnMyDeviceAccountType},
          {kAccountClass, kDeviceLocalAccountClass},
          {kAccountTypeString, nameOfType},
          {kAccountShortTypeString, nameOfType},
          {kAccountIdentifier, _identifier()}};
}

std::string_view DeviceLocalAccount::_identifier() {
  return kDeviceLocalAccountClass;
}

std::string DeviceLocalAccount::typeString() {
  return deviceSpecificString(kOnMyDevicePrefix);
}

std::string DeviceLocalAccount::tetheredSourceForDataClass(std::string_view dataclass) {
  const std::unique_ptr<PairingConnection> connection =
      Process::current().platform.pairingValueStore.connect();
  const std::optional<PropertyValue> answer =
      connection ? connection->copyValue(kTetheredSyncDomain, tetheredSyncKey(dataclass))
                 : std::nullopt;
  const PropertyDictionary* values = answer ? answer->asDictionary() : nullptr;
  const std::optional<Text> source =
      values != nullptr ? values->textForKey(kSyncingSystemKey) : std::nullopt;
  return source ? source->string() : std::string(kNoSource);
}

bool DeviceLocalAccount::isTetheredSyncingDataclass(std::string_view dataclass) {
  const std::string source = tetheredSourceForDataClass(dataclass);
  return source == kDorsaSource || source == kWindowsSource;
}

std::string DeviceLocalAccount::localizedSyncSourceStringForDataClass_forBeginningOfSentence(
    std::string_view dataclass, bool beginningOfSentence) {
  return textForSource(tetheredSourceForDataClass(dataclass),
                       beginningOfSentence ? kTextsAtBeginningOfSentence : kTextsInMidSentence);
}

std::string DeviceLocalAccount::localizedReferenceToSyncSourceStringForDataClass(
    std::string_view dataclass) {
  return textForSource(tetheredSourceForDataClass(dataclass), kTextsOfReference);
}

}  // namespace accounts
