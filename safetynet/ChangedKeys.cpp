#include "safetynet/ChangedKeys.h"

#include <algorithm>
#include <array>
#include <span>

#include "vocabulary/AccountClasses.h"
#include "vocabulary/AccountVocabulary.h"
#include "vocabulary/DeviceServices.h"
#include "vocabulary/LegacyStoreKeys.h"
#include "vocabulary/MigrationStages.h"

namespace accounts {
namespace {

using Texts = std::span<const std::string_view>;

// In the place of keys that the device's framework supplies.
constexpr std::string_view kStatusMark = "<status>";
constexpr std::string_view kPrimaryMark = "<primary account>";

/// Keys that a stage may change in accounts of some types or some classes; of all for an empty
/// list.
struct Row {
  std::string_view stage;
  Texts types;
  Texts classes;
  Texts keys;
};

const std::array kSyncedTypes = {kVelmoraAccountType, kMailAccountType, kExchangeAccountType};
const std::array kOutgoingType = {kSMTPAccountType};
const std::array kOnDeviceType = {kOnMyDeviceAccountType};
const std::array kHostedType = {kVelmoraAccountType};
const std::array kCloudType = {kQuarxAccountType};
const std::array kCloudTypes = {kQuarxAccountType, kVelmoraAccountType};
constexpr std::array kWebMailClasses = {kIMAPAccountClass, kGmailAccountClass, kYahooAccountClass,
                                        kAOLAccountClass, kVelmoraAccountClass};
constexpr std::array kUmbrellaClasses = {kGmailAccountClass, kYahooAccountClass};
constexpr std::array kMailOnlyClasses = {kIMAPAccountClass, kGmailAccountClass, kYahooAccountClass,
                                         kAOLAccountClass, kPOPAccountClass};
constexpr std::array kCloudClass = {kCloudAccountClass};

const std::array kIdentifiers = {kAccountIdentifier, kLegacyMailIdentifier, kAccountSyncIdentifier};
const std::array kOutgoingIdentifiers = {kAccountIdentifier, kLegacyMailIdentifier};
const std::array kEnabled = {kAccountEnabledDataclasses};
const std::array kTypeKey = {kAccountType};
const std::array kCloudKeys = {std::string_view(kStatusMark), kAccountDisplayName,
                               kAccountTypeString, kAccountShortTypeString,
                               std::string_view(kPrimaryMark)};
constexpr std::array kPrimaryKey = {kPrimaryMark};
const std::array kProvisioningKeys = {std::string_view(kStatusMark),
                                      kAccountProvisionedDataclasses};
const std::array kDataclassKeys = {kAccountProvisionedDataclasses, kAccountEnabledDataclasses};

const std::array<Row, 14> kRows = {{
    {kStep7A150, kSyncedTypes, {}, kIdentifiers},
    {kStep7A150, kOutgoingType, {}, kOutgoingIdentifiers},
    {kStep7A153, kOnDeviceType, {}, kEnabled},
    {kStep7A241, kHostedType, {}, kEnabled},
    {kStep7A242, {}, kWebMailClasses, kEnabled},
    {kStep7A242, {}, kUmbrellaClasses, kTypeKey},
    {kStep8C136, {}, kMailOnlyClasses, kEnabled},
    {kStep9A182, {}, {}, kEnabled},
    {kStep9A182, {}, kCloudClass, kCloudKeys},
    {kStep9A182, kCloudType, {}, kPrimaryKey},
    {kStep9A334, kCloudTypes, {}, kEnabled},
    {kStep9A334, {}, kCloudClass, kProvisioningKeys},
    {kStep9B176, kCloudTypes, {}, kDataclassKeys},
    {kStep8A293, {}, {}, kEnabled},
}};

bool isAmong(Texts texts, std::string_view text) {
  return std::ranges::find(texts, text) != texts.end();
}

/// Whether a text of an account is, or was, among some; any will do where the list is empty.
bool holds(Texts texts, std::string_view key, const PropertyDictionary& before,
           const PropertyDictionary& after) {
  const auto has = [&](const PropertyDictionary& account) {
    const std::optional<Text> text = account.textForKey(key);
    return text && isAmong(texts, text->view());
  };
  return texts.empty() || has(before) || has(after);
}

bool hasText(const PropertyDictionary& account, std::string_view key) {
  return account.textForKey(key).has_value();
}

/// What a conversion sets besides the keys that it renames.
bool maySetWhileConverting(std::string_view key, AccountOrigin::Kind origin,
                           const PropertyDictionary& before, const PropertyDictionary& after) {
  if (origin == AccountOrigin::Kind::Exchange) {
    return key == kAccountEnabledDataclasses || key == kAccountType || key == kAccountTypeString ||
           key == kAccountShortTypeString || key == kAccountSyncIdentifier;
  }
  if (origin != AccountOrigin::Kind::OutgoingMail && origin != AccountOrigin::Kind::IncomingMail) {
    return false;
  }
  const bool setsTypeTexts = hasText(before, kAccountClass) || hasText(after, kAccountClass);
  return key == kAccountType || key == kAccountSyncIdentifier ||
         (key == kAccountClass && !hasText(before, kAccountClass) &&
          origin == AccountOrigin::Kind::OutgoingMail) ||
         (setsTypeTexts && (key == kAccountTypeString || key == kAccountShortTypeString)) ||
         (key == kAccountUsername && after.textForKey(kAccountType) == kVelmoraAccountType);
}

}  // namespace

DeviceFacts factsOf(const Platform& platform) {
  return {.cloudStatusKey = platform.cloudAccountService.statusKey(),
          .cloudPrimaryAccountKey = platform.cloudAccountService.primaryAccountKey(),
          .hasOldestProcessor = platform.deviceInfoService.copyAnswer(kArchitectureQuestion) ==
                                PropertyValue(kArchitectureWithoutMultitasking)};
}

std::string_view ChangedKeys::named(std::string_view key) const {
  if (key == kStatusMark) {
    return facts_.cloudStatusKey;
  }
  return key == kPrimaryMark ? facts_.cloudPrimaryAccountKey : key;
}

bool ChangedKeys::mayDiffer(std::string_view key, AccountOrigin::Kind origin,
                            const PropertyDictionary& before,
                            const PropertyDictionary& after) const {
  if ((key == kAccountIdentifier || key == kAccountSyncIdentifier) &&
      !hasText(before, kAccountIdentifier)) {
    // The record gives itself a fresh one.
    return true;
  }
  static const std::array fixedTypes = {kMailAccountType, kVelmoraAccountType};
  if (key == kAccountClass && holds(fixedTypes, kAccountType, before, after)) {
    return true;
  }
  if (maySetWhileConverting(key, origin, before, after)) {
    return true;
  }
  return std::ranges::any_of(kRows, [&](const Row& row) {
    return told_.hasRun(row.stage) && (row.stage != kStep8A293 || facts_.hasOldestProcessor) &&
           std::ranges::any_of(row.keys,
                               [&](std::string_view each) { return named(each) == key; }) &&
           holds(row.types, kAccountType, before, after) &&
           holds(row.classes, kAccountClass, before, after);
  });
}

bool ChangedKeys::mayDifferInChild(std::string_view key, const PropertyDictionary& parent,
                                   const PropertyDictionary& before) const {
  constexpr std::array kHosted = {kVelmoraAccountClass, kMarrowAccountClass};
  if (!told_.hasRun(kStep8C136) || !holds(kCloudClass, kAccountClass, parent, parent) ||
      !holds(kHosted, kAccountClass, before, before)) {
    return false;
  }
  return key == kAccountDisplayName ||
         ((key == kAccountIdentifier || key == kAccountSyncIdentifier) &&
          !hasText(before, kAccountIdentifier));
}

}  // namespace accounts
