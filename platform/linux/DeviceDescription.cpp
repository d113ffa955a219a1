#include "platform/linux/DeviceDescription.h"

#include <cstdint>
#include <string_view>
#include <utility>

#include "platform/linux/DictionaryFile.h"
#include "platform/linux/FileContents.h"

namespace accounts {
namespace {

constexpr std::string_view kSources = "Sources";
constexpr std::string_view kError = "Error";

struct RestrictionKey {
  RestrictedFeature feature;
  std::string_view key;
};

constexpr std::array<RestrictionKey, kRestrictedFeatureCount> kRestrictionKeys = {{
    {RestrictedFeature::CloudDocumentSync, "allowCloudDocumentSync"},
    {RestrictedFeature::PhotoStream, "allowPhotoStream"},
    {RestrictedFeature::SharedPhotoStreams, "allowSharedPhotoStreams"},
    {RestrictedFeature::CloudBackup, "allowCloudBackup"},
    {RestrictedFeature::CardsAndPassesWhileLocked, "allowCardsAndPassesWhileLocked"},
}};

struct SyncDataTypeKey {
  SyncDataType dataType;
  std::string_view key;
};

constexpr std::array<SyncDataTypeKey, kSyncDataTypeCount> kSyncDataTypeKeys = {{
    {SyncDataType::Bookmarks, "Bookmarks"},
    {SyncDataType::Calendars, "Calendars"},
    {SyncDataType::Contacts, "Contacts"},
    {SyncDataType::Notes, "Notes"},
}};

struct CloudAccountKey {
  std::string_view key;
  std::string DeviceDescription::*text;
};

constexpr CloudAccountKey kCloudAccountKeys[] = {
    {"StatusKey", &DeviceDescription::cloudStatusKey},
    {"PrimaryAccountKey", &DeviceDescription::cloudPrimaryAccountKey},
    {"DisplayName", &DeviceDescription::cloudAccountTypeDisplayName},
};

PropertyDictionary dictionaryOrEmpty(const PropertyDictionary& dictionary, std::string_view key) {
  return dictionary.dictionaryForKey(key).value_or(PropertyDictionary());
}

RestrictionAnswer restrictionAnswer(const PropertyValue* value) {
  const std::optional<std::int64_t> number = value != nullptr ? value->integerValue() : 0;
  for (const RestrictionAnswer answer :
       {RestrictionAnswer::ExplicitlyAllowed, RestrictionAnswer::ExplicitlyNotAllowed}) {
    if (number == static_cast<std::int64_t>(answer)) {
      return answer;
    }
  }
  return RestrictionAnswer::NoSetting;
}

ExternalSyncSourcesAnswer syncSourcesAnswer(const PropertyDictionary& dictionary) {
  ExternalSyncSourcesAnswer answer;
  answer.sources = dictionary.arrayForKey(kSources);
  if (const auto error = dictionary.textForKey(kError)) {
    answer.error = error->string();
  }
  return answer;
}

}  // namespace

DeviceDescription deviceDescriptionFromDictionary(const PropertyDictionary& dictionary) {
  DeviceDescription description;
  description.deviceInfo = dictionaryOrEmpty(dictionary, kDeviceInfoKey);
  description.pairingValues = dictionary.dictionaryForKey(kPairingValuesKey);

  const PropertyDictionary restrictions = dictionaryOrEmpty(dictionary, kProfileRestrictionsKey);
  for (const auto& [feature, key] : kRestrictionKeys) {
    description.profileRestrictions[static_cast<std::size_t>(feature)] =
        restrictionAnswer(restrictions.find(key));
  }
  const PropertyDictionary syncSources = dictionaryOrEmpty(dictionary, kExternalSyncSourcesKey);
  for (const auto& [dataType, key] : kSyncDataTypeKeys) {
    description.externalSyncSources[static_cast<std::size_t>(dataType)] =
        syncSourcesAnswer(dictionaryOrEmpty(syncSources, key));
  }
  const PropertyDictionary cloudAccount = dictionaryOrEmpty(dictionary, kCloudAccountKey);
  for (const auto& [key, text] : kCloudAccountKeys) {
    if (const auto given = cloudAccount.textForKey(key)) {
      description.*text = given->string();
    }
  }
  return description;
}

OrFailure<DescriptionBytes> readDeviceDescription(const DeviceRoot& root) {
  auto bytes = root.readFile(kDeviceDescriptionPath);
  if (!bytes && !bytes.error().isMissing()) {
    return bytes.error();
  }
  DescriptionBytes read = {.bytes = {}, .path = std::string(kDeviceDescriptionPath)};
  if (bytes) {
    read.bytes = *std::move(bytes);
  }
  return read;
}

OrFailure<DescriptionBytes> readHostDeviceDescription(const std::string& path) {
  auto bytes = readHostFile(path);
  if (!bytes) {
    return bytes.error();
  }
  return DescriptionBytes{*std::move(bytes), nameOfInput(path)};
}

OrFailure<DeviceDescription> decodeDeviceDescription(const DescriptionBytes& read) {
  if (!read.bytes) {
    return DeviceDescription();
  }
  const auto dictionary = dictionaryFromBytes(*read.bytes, read.path);
  if (!dictionary) {
    return dictionary.error();
  }
  return deviceDescriptionFromDictionary(*dictionary);
}

}  // namespace accounts
