#include "tests/smallworld/SmallDevice.h"

#include <array>
#include <functional>
#include <string_view>
#include <vector>

#include "propertylist/binary/BinaryPropertyList.h"
#include "propertylist/value/Description.h"
#include "propertylist/value/PropertyValue.h"
#include "tests/fakes/StoreContents.h"
#include "vocabulary/AccountClasses.h"
#include "vocabulary/AccountVocabulary.h"
#include "vocabulary/LegacyStoreKeys.h"

// The small world is a few parts, each of which is a product: every choice of one thing with every
// choice of the others. A device's number has a digit for each choice.

namespace accounts {
namespace {

struct Kind {
  std::string_view type;
  std::string_view accountClass;
};
/// Every type, and every class that a rule names, as they go together; some as they do not.
const std::array kKinds = std::to_array<Kind>({
    {kMailAccountType, kIMAPAccountClass},
    {kMailAccountType, kPOPAccountClass},
    {kMailAccountType, kAOLAccountClass},
    {kMailAccountType, kGenericMailAccountClass},
    {kMailAccountType, kLocalMailAccountClass},
    {kMailAccountType, kGmailAccountClass},
    {kGmailAccountType, kGmailAccountClass},
    {kMailAccountType, kYahooAccountClass},
    {kYahooAccountType, kYahooAccountClass},
    {kVelmoraAccountType, kVelmoraAccountClass},
    {kVelmoraAccountType, kMarrowAccountClass},
    {kVelmoraAccountType, kCloudAccountClass},
    {kQuarxAccountType, kCloudAccountClass},
    {kQuarxAccountType, kVelmoraAccountClass},
    {kTolvaneIMAPAccountType, kTolvaneIMAPAccountClass},
    {kExchangeAccountType, "ASAccount"},
    {kExchangeAccountType, kDataAccessMailAccountClass},
    {kSMTPAccountType, kSMTPAccountClass},
    {kSMTPAccountType, kDeliveryAccountClass},
    {kCalDAVAccountType, kCalDAVAccountClass},
    {"CardDAV", "CardDAVAccount"},
    {"BookmarkDAV", "BookmarkDAVAccount"},
    {kSubscribedCalendarAccountType, "SubscribedCalendarAccount"},
    {"LDAP", "LDAPAccount"},
    {"IMAPNotes", "IMAPNotesAccount"},
    {kOnMyDeviceAccountType, kDeviceLocalAccountClass},
    {"A type that nobody knows", "SomeAccount"},
});
/// What stands below another account.
const std::array kChildKinds = std::to_array<Kind>({
    {kVelmoraAccountType, kVelmoraAccountClass},
    {kVelmoraAccountType, kMarrowAccountClass},
    {kCalDAVAccountType, kCalDAVAccountClass},
    {kMailAccountType, kIMAPAccountClass},
    {kQuarxAccountType, kCloudAccountClass},
    {"A type that nobody knows", "SomeAccount"},
});

/// A key that an account has or lacks, or whose value is another one than an account mostly has.
struct Deviation {
  std::string_view key;
  std::optional<PropertyValue> value;
};

PropertyDictionary principal(std::string_view server, std::string_view login) {
  return {{"CalDAV_Server_Key", server}, {"Login_Key", login}};
}
PropertyDictionary principalPath(std::string_view path) {
  return {{"CalDAV_PrincipalPath_Key", path}};
}

/// Nothing, and then every key that a rule reads: absent, of the right kind, of a wrong one.
const std::vector<Deviation>& deviations() {
  static const PropertyArray all = {
      kAccountDataclassMail,      kAccountDataclassCalendars, kAccountDataclassReminders,
      kAccountDataclassBookmarks, kAccountDataclassNotes,     kAccountDataclassUbiquity,
      kAccountDataclassKeyValue,  kAccountDataclassShoebox,   kAccountDataclassDeviceLocator};
  static const PropertyDictionary child =
      anAccount("child", kVelmoraAccountType, kVelmoraAccountClass)
          .with(kAccountDisplayName, "Velmora");
  static const std::vector<Deviation> list = {
      {"", {}},
      {kAccountIdentifier, {}},
      {kAccountIdentifier, ""},
      {kAccountIdentifier, 7},
      {kAccountIdentifier, "other"},
      {kAccountIdentifier, kDeviceLocalAccountClass},
      {kAccountType, {}},
      {kAccountType, ""},
      {kAccountType, true},
      {kAccountClass, {}},
      {kAccountClass, ""},
      {kAccountClass, true},
      {kLegacyMailIdentifier, "older"},
      {kLegacyMailIdentifier, ""},
      {kLegacyMailIdentifier, 7},
      {kAccountSyncIdentifier, "sync"},
      {kAccountSyncIdentifier, 7},
      {kAccountDisplayName, "Velmora"},
      {kAccountDisplayName, 7},
      {kAccountUsername, {}},
      {kAccountUsername, "anna@velmora.example"},
      {kAccountUsername, "a b/c?"},
      {kAccountUsername, 7},
      {kAccountEnabledDataclasses, {}},
      {kAccountEnabledDataclasses, PropertyArray()},
      {kAccountEnabledDataclasses, PropertyArray{"com.quarx.Dataclass.Unheard", 7}},
      {kAccountEnabledDataclasses, PropertyArray{kAccountDataclassNotes}},
      {kAccountEnabledDataclasses, PropertyArray{kAccountDataclassKeyValue}},
      {kAccountEnabledDataclasses, all},
      {kAccountEnabledDataclasses, "none"},
      {kAccountProvisionedDataclasses, PropertyArray()},
      {kAccountProvisionedDataclasses, all},
      {kAccountProvisionedDataclasses, "none"},
      {kAccountSupportedDataclasses, PropertyArray{kAccountDataclassMail}},
      {kIsActiveKey, false},
      {kIsActiveKey, true},
      {kIsActiveKey, "yes"},
      {"status", 1},
      {"status", 2},
      {"status", 3},
      {"status", "2"},
      {"primaryAccount", false},
      {"primaryAccount", true},
      {"primaryAccount", "yes"},
      {"CalDAVEnabled", true},
      {"CalDAVEnabled", false},
      {kCalendarsAccountSubscribedCalendars, PropertyArray{"calendar"}},
      {kExoSubscribedCalendarsKey, PropertyArray{"calendar"}},
      {kExoSubscribedCalendarsKey, 7},
      {"CalDAVPrincipalConfiguration", principal("www.google.com", "anna")},
      {"CalDAVPrincipalConfiguration", principal("caldav.calendar.yahoo.com", "anna")},
      {"CalDAVPrincipalConfiguration", 7},
      {"CalDAVAccountConfiguration", principalPath("/calendar/dav/anna/user")},
      {"CalDAVAccountConfiguration", principalPath("/principals/users/anna")},
      {"CalDAVAccountConfiguration", 7},
      {"AccountPath", "/var/mobile/Library/Mail/IMAP-anna@imap.gmail.com"},
      {"AccountPath", "/var/mobile/Library/Mail/POP-anna@host"},
      {"AccountPath", 7},
      {kAccountChildAccounts, PropertyArray()},
      {kAccountChildAccounts, PropertyArray{7}},
      {kAccountChildAccounts, PropertyArray{child, child}},
      {kAccountChildAccounts, "none"},
      {"A key that nobody knows", PropertyDictionary{{"deep", PropertyArray{1, 2.5, "x"}}}},
  };
  return list;
}

PropertyDictionary with(PropertyDictionary account, const Deviation& deviation) {
  if (deviation.value) {
    account.set(deviation.key, *deviation.value);
  } else {
    account.remove(deviation.key);
  }
  return account;
}
PropertyDictionary withDeviation(PropertyDictionary account, std::size_t which) {
  return with(std::move(account), deviations()[which]);
}

AccountDictionary account(std::string_view identifier, const Kind& kind) {
  return anAccount(identifier, kind.type, kind.accountClass)
      .with(kAccountUsername, "anna")
      .enabledFor({kAccountDataclassMail, kAccountDataclassNotes, kAccountDataclassCalendars});
}
/// The calendar half of the web-mail accounts above.
PropertyDictionary calendars(std::string_view identifier) {
  return account(identifier, {kCalDAVAccountType, kCalDAVAccountClass})
      .with("CalDAVPrincipalConfiguration", principal("www.google.com", "anna"))
      .with("CalDAVAccountConfiguration", principalPath("/calendar/dav/anna/user"));
}
/// 0 for no child.
PropertyDictionary withChild(PropertyDictionary parent, std::size_t which,
                             std::size_t deviation = 0) {
  if (which > 0) {
    parent.set(kAccountChildAccounts,
               PropertyArray{withDeviation(account("child", kChildKinds[which - 1]), deviation)});
  }
  return parent;
}

/// Every stored version, one of the future, none, and what is no number.
constexpr std::size_t kVersions = 16;
std::optional<PropertyValue> versionAt(std::size_t which) {
  constexpr std::size_t kWithVersion = 14;
  return which < kWithVersion    ? std::optional<PropertyValue>(which)
         : which == kWithVersion ? std::nullopt
                                 : std::optional<PropertyValue>("5");
}
PropertyDictionary settings(std::size_t version, PropertyArray accounts) {
  PropertyDictionary root = {{kPlistAccountsKey, std::move(accounts)}};
  if (const auto value = versionAt(version)) {
    root.set(kPlistVersionKey, *value);
  }
  return root;
}

void put(SmallDevice& device, DevicePlace place, const PropertyValue& value) {
  device.files[place] = writeBinaryPropertyList(value).value();
  device.description.append(listed(place).name).append(" ").append(describe(value)).append("\n");
}

using Digits = std::vector<std::size_t>;
struct Part {
  /// How many choices each digit has.
  Digits choices;
  SmallDevice (*make)(const Digits& digits);
};

SmallDevice oneAccount(std::size_t version, PropertyDictionary only) {
  SmallDevice device;
  put(device, DevicePlace::Settings, settings(version, PropertyArray{std::move(only)}));
  return device;
}

/// One account, what is special about it, and its child.
SmallDevice oneSpecialAccount(const Digits& d) {
  return oneAccount(d[0], withDeviation(withChild(account("one", kKinds[d[1]]), d[2]), d[3]));
}
/// One account with two specialities.
SmallDevice oneVerySpecialAccount(const Digits& d) {
  constexpr std::array<std::size_t, 3> versions = {0, 4, 9};
  return oneAccount(versions[d[0]],
                    withDeviation(withDeviation(account("one", kKinds[d[1]]), d[2]), d[3]));
}
/// One account, and what is special about its child.
SmallDevice oneSpecialChild(const Digits& d) {
  constexpr std::array<std::size_t, 5> versions = {0, 6, 9, 10, 12};
  return oneAccount(versions[d[0]], withChild(account("one", kKinds[d[1]]), d[2] + 1, d[3]));
}

/// Two accounts and what they have to do with each other.
SmallDevice twoAccounts(const Digits& d) {
  constexpr std::array<std::size_t, 3> children = {0, 1, 3};
  PropertyDictionary first = withChild(account("one", kKinds[d[1]]), children[d[3]]);
  PropertyDictionary second = account("two", kKinds[d[2]]);
  switch (d[4]) {
    case 1:  // One identifier for both.
      second.set(kAccountIdentifier, "one");
      break;
    case 2:  // The second is the first's child as well.
      second.set(kAccountIdentifier, "child");
      break;
    case 3:  // No identifier for either.
      first.remove(kAccountIdentifier);
      second.remove(kAccountIdentifier);
      break;
    case 4:  // Both alike in all.
      second = first;
      break;
    case 5:  // Both cloud accounts that stand for the hosted service.
      first.set("status", 2);
      second.set("status", 2);
      break;
    default:
      break;
  }
  SmallDevice device;
  put(device, DevicePlace::Settings,
      settings(d[0], PropertyArray{std::move(first), std::move(second)}));
  return device;
}

/// A web-mail account and a calendar account, each a little off.
SmallDevice mailAndCalendars(const Digits& d) {
  PropertyDictionary mail = withDeviation(account("one", kKinds[d[1]]), d[2]);
  PropertyDictionary calendar = withDeviation(calendars("two"), d[3]);
  SmallDevice device;
  put(device, DevicePlace::Settings,
      settings(d[0], d[4] == 0 ? PropertyArray{std::move(mail), std::move(calendar)}
                               : PropertyArray{std::move(calendar), std::move(mail)}));
  return device;
}

/// A root that is no dictionary, an empty one, a list that is none, and lists of what is none.
constexpr std::size_t kOddStores = 5;
PropertyValue oddStore(std::size_t which, std::string_view list) {
  switch (which) {
    case 0:
      return "no dictionary";
    case 1:
      return PropertyDictionary();
    case 2:
      return PropertyDictionary{{list, "no list"}};
    case 3:
      return PropertyDictionary{{kLegacyOutgoingAccounts, PropertyArray{7}}};
    default:
      return PropertyDictionary{{list, PropertyArray{7}}};
  }
}

/// What is special about a description, by keys that both stores' descriptions have.
const std::vector<Deviation>& descriptionDeviations() {
  static const std::vector<Deviation> list = {
      {"", {}},
      {kAccountUsername, "anna@velmora.example"},
      {kAccountIdentifier, "newer"},
      {kAccountClass, "SomeAccount"},
      {kAccountType, kQuarxAccountType},
      {kLegacyMailIdentifier, {}},
      {kLegacyMailIdentifier, 7},
      {kLegacyMailIdentifier, "one"},
      {kLegacyMailClass, {}},
      {kLegacyMailClass, 7},
      {kLegacyExchangeIdentifier, {}},
      {kLegacyExchangeIdentifier, 7},
      {kLegacyExchangeIdentifier, "one"},
      {kLegacyExchangeClass, {}},
      {kLegacyExchangeSwitches[0], false},
      {kLegacyExchangeSwitches[1], true},
      {kLegacyExchangeSwitches[2], "no"},
  };
  return list;
}
PropertyDictionary mailDescription(std::size_t kind, std::size_t deviation) {
  return with(aMailDescription("mail", kKinds[kind].accountClass)
                  .with(kLegacyMailDisplayName, "Mail")
                  .with(kAccountUsername, "anna"),
              descriptionDeviations()[deviation]);
}
PropertyDictionary exchangeDescription(std::size_t deviation) {
  return with(anExchangeDescription("exchange").with(kLegacyExchangeDisplayName, "Exchange"),
              descriptionDeviations()[deviation]);
}

void putSettingsBesideStores(SmallDevice& device, std::size_t which) {
  constexpr std::size_t kWithoutAccounts = 3;
  if (which == 0) {
    return;
  }
  if (which == 1) {
    put(device, DevicePlace::Settings, "no dictionary");
    return;
  }
  PropertyArray accounts;
  if (which >= kWithoutAccounts) {
    accounts.append(account("one", kKinds[which - kWithoutAccounts]));
  }
  put(device, DevicePlace::Settings, settings(0, std::move(accounts)));
}
constexpr std::size_t kSettingsBesideStores = 3 + kKinds.size();

/// A mail store and a settings file.
SmallDevice mailStore(const Digits& d) {
  SmallDevice device;
  putSettingsBesideStores(device, d[0]);
  const PropertyDictionary description = mailDescription(d[1], d[2]);
  const std::string_view list = d[3] == 0 ? kLegacyIncomingAccounts : kLegacyOutgoingAccounts;
  put(device, DevicePlace::LegacyMail, PropertyDictionary{{list, PropertyArray{description}}});
  return device;
}
/// An Exchange store and a settings file.
SmallDevice exchangeStore(const Digits& d) {
  SmallDevice device;
  putSettingsBesideStores(device, d[0]);
  put(device, DevicePlace::LegacyExchange,
      PropertyDictionary{{kLegacyExchangeAccounts, PropertyArray{exchangeDescription(d[1])}}});
  return device;
}
/// Both stores, odd ones and none among them, and what else may stand beside them.
SmallDevice bothStores(const Digits& d) {
  SmallDevice device;
  putSettingsBesideStores(device, d[0]);
  if (d[1] < kOddStores) {
    put(device, DevicePlace::LegacyMail, oddStore(d[1], kLegacyIncomingAccounts));
  } else if (d[1] > kOddStores) {
    put(device, DevicePlace::LegacyMail,
        PropertyDictionary{
            {kLegacyOutgoingAccounts, PropertyArray{mailDescription(0, 0)}},
            {kLegacyIncomingAccounts, PropertyArray{mailDescription(5, d[1] - kOddStores)}}});
  }
  if (d[2] < kOddStores) {
    put(device, DevicePlace::LegacyExchange, oddStore(d[2], kLegacyExchangeAccounts));
  } else if (d[2] > kOddStores) {
    put(device, DevicePlace::LegacyExchange,
        PropertyDictionary{
            {kLegacyExchangeAccounts, PropertyArray{exchangeDescription(d[2] - kOddStores)}}});
  }
  for (const DevicePlace place : {DevicePlace::LegacyMailOriginal, DevicePlace::AutoFetchEnabled,
                                  DevicePlace::LegacyExchangeOriginal, DevicePlace::CopyAside}) {
    if (d[3] > 0) {
      put(device, place, "left by another program");
    }
  }
  device.usesGoogleMail = d[3] > 0;
  if (d[4] > 0) {
    device.files[DevicePlace::RemovalSentinel] = kRemovalSentinelContents;
    device.description += "an interrupted removal\n";
  }
  return device;
}

/// What the services of a device answer.
SmallDevice services(const Digits& d) {
  SmallDevice device =
      oneAccount(d[0], account(d[5] == 0 ? "one" : kDeviceLocalAccountClass, kKinds[d[1]]));
  device.runsOneProgram = d[2] > 0;
  device.savesInformation = d[3] > 0;
  const std::array<ExternalSyncSourcesAnswer, 6> answers = {{
      {},
      {{}, ""},
      {PropertyArray(), {}},
      {PropertyArray{"a source"}, {}},
      {PropertyArray{"a source", "DenyTethered"}, {}},
      {PropertyArray{"a source"}, "not now"},
  }};
  device.syncSources = answers[d[4]];
  device.description +=
      "services " + std::to_string(d[2]) + std::to_string(d[3]) + std::to_string(d[4]) + "\n";
  return device;
}

const std::vector<Part>& parts() {
  static const std::size_t special = deviations().size();
  static const std::size_t specialDescriptions = descriptionDeviations().size();
  static const std::size_t kinds = kKinds.size();
  static const std::size_t childKinds = kChildKinds.size();
  static const std::size_t oddDescriptions = kOddStores + specialDescriptions;
  static const std::vector<Part> list = {
      {{kVersions, kinds, childKinds + 1, special}, oneSpecialAccount},
      {{3, kinds, special, special}, oneVerySpecialAccount},
      {{5, kinds, childKinds, special}, oneSpecialChild},
      {{kVersions, kinds, kinds, 3, 6}, twoAccounts},
      {{2, kinds, special, special, 2}, mailAndCalendars},
      {{kSettingsBesideStores, kinds, specialDescriptions, 2}, mailStore},
      {{kSettingsBesideStores, specialDescriptions}, exchangeStore},
      {{kSettingsBesideStores, oddDescriptions, oddDescriptions, 2, 2}, bothStores},
      {{kVersions, kinds, 2, 2, 6, 2}, services},
  };
  return list;
}

std::uint64_t sizeOf(const Part& part) {
  std::uint64_t size = 1;
  for (const std::size_t choices : part.choices) {
    size *= choices;
  }
  return size;
}

}  // namespace

std::uint64_t smallWorldSize() {
  std::uint64_t size = 0;
  for (const Part& part : parts()) {
    size += sizeOf(part);
  }
  return size;
}

SmallDevice smallDevice(std::uint64_t number) {
  for (const Part& part : parts()) {
    if (number >= sizeOf(part)) {
      number -= sizeOf(part);
      continue;
    }
    Digits digits;
    for (const std::size_t choices : part.choices) {
      digits.push_back(number % choices);
      number /= choices;
    }
    return part.make(digits);
  }
  return {};
}

}  // namespace accounts
