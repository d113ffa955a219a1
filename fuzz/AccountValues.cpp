#include "fuzz/AccountValues.h"

#include <array>
#include <span>

#include "fuzz/AnyValue.h"
#include "vocabulary/AccountVocabulary.h"

namespace accounts {

namespace {

constexpr std::size_t kMostAccounts = 8;
constexpr std::size_t kMostChildren = 3;
constexpr std::size_t kMostProperties = 8;

constexpr std::array<std::string_view, 12> classes = {
    "IMAPAccount",   "GmailAccount",   "YahooAccount",        "AOLAccount",
    "POPAccount",    "MailAccount",    "SMTPAccount",         "ZQAccount",
    "DAMailAccount", "VelmoraAccount", "MobileCalDAVAccount", "MarrowAccount"};
constexpr std::array<std::string_view, 8> identifiers = {
    "A", "B", "C", "D", "E", "F", "DeviceLocalAccount", ""};
constexpr std::array<std::string_view, 4> usernames = {"user", "user@gmail.com", "user%@x", ""};
constexpr std::array<std::string_view, 5> servers = {"www.google.com", "caldav.calendar.yahoo.com",
                                                     "imap.gmail.com", "imap.mail.yahoo.com", ""};
constexpr std::array<std::string_view, 4> principalPaths = {
    "/calendar/dav/user/user", "/calendar/dav/user%40gmail.com/user", "/principals/users/user", ""};
constexpr std::array<std::string_view, 6> mailPaths = {
    "/var/mobile/Library/Mail/IMAP-user@host",
    "/var/mobile/Library/Mail/POP-user@host",
    "/var/mobile/Library/Mail/Dorsa-user",
    "/var/mobile/Library/Mail/IMAP-user%gmail.com@imap.gmail.com",
    "/var/mobile/Library/Mail/elsewhere",
    ""};

Text oneOf(FuzzInput& input, std::span<const std::string_view> texts) {
  const std::size_t choice = input.below(texts.size() + 1);
  return choice < texts.size() ? Text(texts[choice]) : anyText(input);
}

PropertyValue accountClass(FuzzInput& input) {
  return oneOf(input, classes);
}
PropertyValue accountType(FuzzInput& input) {
  return typeFrom(input);
}
PropertyValue identifier(FuzzInput& input) {
  return oneOf(input, identifiers);
}
PropertyValue username(FuzzInput& input) {
  return oneOf(input, usernames);
}
PropertyValue mailPath(FuzzInput& input) {
  return oneOf(input, mailPaths);
}
PropertyValue someText(FuzzInput& input) {
  return anyText(input);
}
PropertyValue yesOrNo(FuzzInput& input) {
  return input.flag();
}
PropertyValue smallNumber(FuzzInput& input) {
  return input.below(4);
}
PropertyValue dataclasses(FuzzInput& input) {
  PropertyArray list;
  for (std::size_t count = input.below(5); count > 0; --count) {
    list.append(dataclassFrom(input));
  }
  return list;
}
PropertyValue calDAVPrincipal(FuzzInput& input) {
  const Text server = oneOf(input, servers);
  return PropertyDictionary{{"CalDAV_Server_Key", server}, {"Login_Key", oneOf(input, usernames)}};
}
PropertyValue calDAVAccount(FuzzInput& input) {
  return PropertyDictionary{{"CalDAV_PrincipalPath_Key", oneOf(input, principalPaths)}};
}

/// A key of an account and what makes a plausible value for it.
struct Property {
  std::string_view key;
  PropertyValue (*value)(FuzzInput& input);
};

PropertyValue children(FuzzInput& input);

const std::array<Property, 22> accountProperties = {{
    {kAccountDisplayName, someText},
    {kAccountUsername, username},
    {kAccountEnabledDataclasses, dataclasses},
    {kAccountProvisionedDataclasses, dataclasses},
    {kAccountSupportedDataclasses, dataclasses},
    {kAccountChildAccounts, children},
    {kAccountSyncIdentifier, identifier},
    {kAccountTypeString, someText},
    {"uniqueId", identifier},
    {"IsActive", yesOrNo},
    {"status", smallNumber},
    {"primaryAccount", yesOrNo},
    {"AccountPath", mailPath},
    {"CalDAVPrincipalConfiguration", calDAVPrincipal},
    {"CalDAVAccountConfiguration", calDAVAccount},
    {"CalDAVEnabled", yesOrNo},
    {kCalendarsAccountSubscribedCalendars, dataclasses},
    {"DAExoSubscribedCalendarInfos", dataclasses},
    // Those that every account needs can be overwritten or be of the wrong kind.
    {kAccountType, accountType},
    {kAccountClass, accountClass},
    {kAccountIdentifier, identifier},
    {"Unknown Key", someText},
}};

const std::array<Property, 6> legacyMailProperties = {{
    {"AccountType", accountClass},
    {"AccountName", someText},
    {"uniqueId", identifier},
    {kAccountUsername, username},
    {"AccountPath", mailPath},
    {"IsActive", yesOrNo},
}};

const std::array<Property, 7> legacyExchangeProperties = {{
    {"DAAccountConfigurationClass", accountClass},
    {"DAAccountDescription", someText},
    {"DAAccountConfigurationAccountID", identifier},
    {"DAAccountEnabledForCalendar", yesOrNo},
    {"DAAccountEnabledForContacts", yesOrNo},
    {"DAAccountEnabledForEmail", yesOrNo},
    {"DAAccountEnabledForContactsSearch", yesOrNo},
}};

/// Adds a few properties, of which some are known and have plausible values.
void addProperties(FuzzInput& input, std::span<const Property> known,
                   PropertyDictionary& dictionary) {
  for (std::size_t count = input.below(kMostProperties + 1); count > 0; --count) {
    const std::size_t choice = input.below(known.size() + 1);
    if (choice == known.size()) {
      Text key = anyText(input);
      dictionary.set(std::move(key), anyValue(input));
    } else if (input.below(8) == 7) {
      dictionary.set(known[choice].key, anyValue(input));
    } else {
      dictionary.set(known[choice].key, known[choice].value(input));
    }
  }
}

PropertyDictionary accountWithProperties(FuzzInput& input, std::span<const Property> known) {
  PropertyDictionary account;
  account.set(kAccountType, accountType(input));
  account.set(kAccountClass, accountClass(input));
  if (input.below(8) != 7) {
    account.set(kAccountIdentifier, identifier(input));
  }
  addProperties(input, known, account);
  return account;
}

/// An element of a list of dictionaries, which is rarely something else.
template <class Make>
PropertyValue elementFrom(FuzzInput& input, Make&& make) {
  return input.seldom() ? anyValue(input) : PropertyValue(make(input));
}

PropertyValue children(FuzzInput& input) {
  PropertyArray list;
  for (std::size_t count = input.below(kMostChildren + 1); count > 0; --count) {
    list.append(elementFrom(input, [](FuzzInput& rest) {
      // A child's own children are not looked at, so those of any kind do.
      PropertyDictionary child = accountWithProperties(rest, {});
      addProperties(rest, std::span(accountProperties).first(5), child);
      return child;
    }));
  }
  return list;
}

PropertyDictionary legacyDescription(FuzzInput& input, std::span<const Property> known) {
  PropertyDictionary description;
  // The class first, since a description is worth nothing without.
  description.set(known.front().key, known.front().value(input));
  addProperties(input, known, description);
  return description;
}

template <class Make>
PropertyArray listFrom(FuzzInput& input, std::size_t most, Make&& make) {
  PropertyArray list;
  for (std::size_t count = input.below(most + 1); count > 0; --count) {
    list.append(elementFrom(input, make));
  }
  return list;
}

/// A list under a key, rarely absent or of another kind.
template <class Make>
void setList(FuzzInput& input, PropertyDictionary& root, std::string_view key, Make&& make) {
  if (input.seldom()) {
    root.set(key, anyValue(input));
  } else if (!input.seldom()) {
    root.set(key, listFrom(input, kMostAccounts, make));
  }
}

PropertyDictionary legacyMailDescription(FuzzInput& input) {
  return legacyDescription(input, legacyMailProperties);
}
PropertyDictionary legacyExchangeDescription(FuzzInput& input) {
  return legacyDescription(input, legacyExchangeProperties);
}

}  // namespace

Text typeFrom(FuzzInput& input) {
  static const std::array<std::string_view, 15> types = {
      kMailAccountType,    kGmailAccountType,       kYahooAccountType,
      kVelmoraAccountType, kQuarxAccountType,       kExchangeAccountType,
      kSMTPAccountType,    kCalDAVAccountType,      kOnMyDeviceAccountType,
      kCardDAVAccountType, kBookmarkDAVAccountType, kSubscribedCalendarAccountType,
      kLDAPAccountType,    kIMAPNotesAccountType,   kTolvaneIMAPAccountType};
  return oneOf(input, types);
}

Text dataclassFrom(FuzzInput& input) {
  static const std::array<std::string_view, 14> known = {
      kAccountDataclassMail,        kAccountDataclassContacts,      kAccountDataclassCalendars,
      kAccountDataclassReminders,   kAccountDataclassBookmarks,     kAccountDataclassNotes,
      kAccountDataclassMediaStream, kAccountDataclassDeviceLocator, kAccountDataclassContactsSearch,
      kAccountDataclassBackup,      kAccountDataclassUbiquity,      kAccountDataclassKeyValue,
      kAccountDataclassShoebox,     kAccountDataclassSharedStreams};
  return oneOf(input, known);
}

PropertyDictionary accountFrom(FuzzInput& input) {
  return accountWithProperties(input, accountProperties);
}

PropertyDictionary settingsFrom(FuzzInput& input) {
  PropertyDictionary root;
  constexpr std::size_t kVersions = 14;
  const std::size_t version = input.below(kVersions + 2);
  if (version < kVersions) {
    root.set(kPlistVersionKey, version);
  } else if (version == kVersions) {
    root.set(kPlistVersionKey, anyValue(input));
  }
  setList(input, root, kPlistAccountsKey, accountFrom);
  return root;
}

PropertyDictionary legacyMailFrom(FuzzInput& input) {
  PropertyDictionary root;
  setList(input, root, "MailAccounts", legacyMailDescription);
  setList(input, root, "DeliveryAccounts", legacyMailDescription);
  return root;
}

PropertyDictionary legacyExchangeFrom(FuzzInput& input) {
  PropertyDictionary root;
  setList(input, root, "DAAccountsKey", legacyExchangeDescription);
  return root;
}

}  // namespace accounts
