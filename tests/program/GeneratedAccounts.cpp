#include "tests/program/GeneratedAccounts.h"

#include <array>
#include <limits>
#include <span>
#include <string>
#include <string_view>

namespace accounts {
namespace {

using Texts = std::span<const std::string_view>;

struct Kind {
  std::string_view type;
  std::string_view accountClass;
};
/// Every type, and every class that a rule names, as they go together.
constexpr std::array kKinds = std::to_array<Kind>({
    {"Mail", "IMAPAccount"},
    {"Mail", "POPAccount"},
    {"Mail", "AOLAccount"},
    {"Mail", "MailAccount"},
    {"Mail", "LocalAccount"},
    {"Mail", "GmailAccount"},
    {"Gmail", "GmailAccount"},
    {"Mail", "YahooAccount"},
    {"Yahoo", "YahooAccount"},
    {"Velmora", "VelmoraAccount"},
    {"Velmora", "MarrowAccount"},
    {"Velmora", "ZQAccount"},
    {"QuarxAccount", "ZQAccount"},
    {"QuarxAccount", "ZQAccount"},
    {"QuarxAccount", "VelmoraAccount"},
    {"TolvaneIMAP", "TolvaneIMAPAccount"},
    {"Exchange", "ASAccount"},
    {"Exchange", "DAMailAccount"},
    {"SMTP", "SMTPAccount"},
    {"SMTP", "DeliveryAccount"},
    {"CalDAV", "MobileCalDAVAccount"},
    {"CalDAV", "MobileCalDAVAccount"},
    {"CardDAV", "CardDAVAccount"},
    {"BookmarkDAV", "BookmarkDAVAccount"},
    {"Subscribed Calendar", "SubscribedCalendarAccount"},
    {"LDAP", "LDAPAccount"},
    {"IMAPNotes", "IMAPNotesAccount"},
    {"OnMyDevice", "DeviceLocalAccount"},
});

constexpr std::array<std::string_view, 16> kDataclasses = {
    "com.quarx.Dataclass.Mail",           "com.quarx.Dataclass.Contacts",
    "com.quarx.Dataclass.Calendars",      "com.quarx.Dataclass.Reminders",
    "com.quarx.Dataclass.Bookmarks",      "com.quarx.Dataclass.Notes",
    "com.quarx.Dataclass.MediaStream",    "com.quarx.Dataclass.DeviceLocator",
    "com.quarx.Dataclass.ContactsSearch", "com.quarx.Dataclass.Backup",
    "com.quarx.Dataclass.Ubiquity",       "com.quarx.Dataclass.KeyValue",
    "com.quarx.Dataclass.Shoebox",        "com.quarx.Dataclass.SharedStreams",
    "com.quarx.Dataclass.Unheard",        ""};

/// Identifiers that devices have, odd ones, and the one that the system itself gives.
constexpr std::array<std::string_view, 14> kIdentifiers = {"0A1B2C3D-4E5F-4A6B-8C7D-0E1F2A3B4C5D",
                                                           "11111111-2222-4333-8444-555555555555",
                                                           "AAAAAAAA-BBBB-4CCC-8DDD-EEEEEEEEEEEE",
                                                           "7F000001-0000-4000-8000-00000000000A",
                                                           "00000000-0000-0000-0000-000000000000",
                                                           "0a1b2c3d-4e5f-4a6b-8c7d-0e1f2a3b4c5d",
                                                           "DeviceLocalAccount",
                                                           "A",
                                                           "B",
                                                           "",
                                                           " ",
                                                           "line\nbreak",
                                                           "\xC3\xA4\xF0\x9F\x98\x80",
                                                           "../../etc/passwd"};

constexpr std::array<std::string_view, 8> kUsernames = {
    "anna", "anna", "anna", "anna@gmail.com", "a b/c?", "@", "", "anna@velmora.example"};
constexpr std::array<std::string_view, 4> kServers = {"www.google.com", "www.google.com",
                                                      "caldav.calendar.yahoo.com", "elsewhere"};
constexpr std::array<std::string_view, 5> kPrincipalPaths = {
    "/calendar/dav/anna/user", "/calendar/dav/anna%40gmail.com/user", "/principals/users/anna",
    "/principals/users/anna/", ""};
constexpr std::array<std::string_view, 11> kMailPaths = {
    "/var/mobile/Library/Mail/IMAP-anna@host",
    "/var/mobile/Library/Mail/POP-anna@host",
    "/var/mobile/Library/Mail/Dorsa-anna",
    "/var/mobile/Library/Mail/Velmora-anna",
    "/var/mobile/Library/Mail/AOL-anna",
    "/var/mobile/Library/Mail/Mailboxes",
    "/var/mobile/Library/Mail/IMAP-anna%gmail.com@imap.gmail.com",
    "/var/mobile/Library/Mail/IMAP-anna@gmail.com@imap.gmail.com",
    "/var/mobile/Library/Mail/IMAP-anna@imap.mail.yahoo.com",
    "/var/mobile/Library/elsewhere",
    ""};
constexpr std::array<std::string_view, 8> kTexts = {
    "Velmora", "Stratix", "Anna's account", "", "12", "yes", "tab\tand \x01", "Yahoo!\xE2\x80\x8E"};

PropertyValue valueUpTo(Choices& choices, std::size_t depth) {
  enum : std::uint8_t { AText, AnInteger, ALargeOne, ABoolean, AReal, ADate, SomeData, AnArray };
  const std::size_t scalars = AnArray;
  switch (choices.below(depth > 0 ? scalars + 2 : scalars)) {
    case AText:
      return choices.of(kTexts);
    case AnInteger:
      return static_cast<std::int64_t>(choices.below(20)) - 4;
    case ALargeOne:
      return std::numeric_limits<std::uint64_t>::max() - choices.below(2);
    case ABoolean:
      return choices.flag();
    case AReal:
      return choices.oneIn(4) ? std::numeric_limits<double>::quiet_NaN()
                              : static_cast<double>(choices.below(100)) / 8;
    case ADate:
      return PropertyDate{static_cast<double>(choices.below(1000000000))};
    case SomeData:
      return PropertyData(choices.of(kTexts));
    case AnArray:
      return PropertyArray{valueUpTo(choices, depth - 1), valueUpTo(choices, depth - 1)};
    default:
      return PropertyDictionary{{choices.of(kTexts), valueUpTo(choices, depth - 1)},
                                {"Identifier", valueUpTo(choices, 0)}};
  }
}

PropertyValue dataclasses(Choices& choices) {
  PropertyArray list;
  for (std::size_t count = choices.below(6); count > 0; --count) {
    list.append(choices.of(kDataclasses));
  }
  if (choices.oneIn(16)) {
    list.append(anyValue(choices));
  }
  return list;
}
PropertyValue identifier(Choices& choices) {
  return choices.of(kIdentifiers);
}
PropertyValue username(Choices& choices) {
  return choices.of(kUsernames);
}
PropertyValue mailPath(Choices& choices) {
  return choices.of(kMailPaths);
}
PropertyValue someText(Choices& choices) {
  return choices.of(kTexts);
}
PropertyValue flag(Choices& choices) {
  return choices.flag();
}
PropertyValue status(Choices& choices) {
  return choices.below(4);
}
PropertyValue someType(Choices& choices) {
  return choices.of(kKinds).type;
}
PropertyValue someClass(Choices& choices) {
  return choices.of(kKinds).accountClass;
}
PropertyValue calDAVPrincipal(Choices& choices) {
  return PropertyDictionary{{"CalDAV_Server_Key", choices.of(kServers)},
                            {"Login_Key", choices.of(kUsernames)}};
}
PropertyValue calDAVAccount(Choices& choices) {
  return PropertyDictionary{{"CalDAV_PrincipalPath_Key", choices.of(kPrincipalPaths)}};
}

/// A key, how seldom an account has it, and what makes a value of the right kind.
struct Property {
  std::string_view key;
  std::size_t oneIn;
  PropertyValue (*value)(Choices& choices);
};

constexpr Property kAccountProperties[] = {
    {"Sync Identifier", 3, identifier},
    {"uniqueId", 4, identifier},
    {"DisplayName", 2, someText},
    {"Username", 2, username},
    {"Password", 6, someText},
    {"Type String", 4, someText},
    {"Short Type String", 6, someText},
    {"Enabled Dataclasses", 2, dataclasses},
    {"Provisioned Dataclasses", 3, dataclasses},
    {"Supported Dataclasses", 8, dataclasses},
    {"Subscribed Calendars", 8, dataclasses},
    {"DAExoSubscribedCalendarInfos", 8, dataclasses},
    {"CalendarsWereMigrated", 10, flag},
    {"CalDAVEnabled", 6, flag},
    {"IsActive", 3, flag},
    {"status", 3, status},
    {"primaryAccount", 4, flag},
    {"AccountPath", 3, mailPath},
    {"CalDAVPrincipalConfiguration", 4, calDAVPrincipal},
    {"CalDAVAccountConfiguration", 4, calDAVAccount},
    {"A key that nobody knows", 5, anyValue},
    // Those that every account needs, once more: of another account, or of the wrong kind.
    {"Identifier", 16, identifier},
    {"Type", 16, someType},
    {"Class", 16, someClass},
};

constexpr Property kMailProperties[] = {
    {"AccountName", 2, someText},   {"Username", 2, username}, {"Password", 4, someText},
    {"AccountPath", 2, mailPath},   {"IsActive", 3, flag},     {"Type", 12, someType},
    {"Identifier", 10, identifier}, {"Class", 12, someClass},  {"Unknown", 6, anyValue},
};

constexpr Property kExchangeProperties[] = {
    {"DAAccountDescription", 2, someText},
    {"DAAccountEnabledForCalendar", 2, flag},
    {"DAAccountEnabledForContacts", 2, flag},
    {"DAAccountEnabledForEmail", 2, flag},
    {"DAAccountEnabledForContactsSearch", 3, flag},
    {"Username", 3, username},
    {"Identifier", 10, identifier},
    {"Class", 12, someClass},
    {"Unknown", 6, anyValue},
};

void addProperties(Choices& choices, std::span<const Property> properties,
                   PropertyDictionary& dictionary) {
  for (const Property& each : properties) {
    if (choices.oneIn(each.oneIn)) {
      dictionary.set(each.key, choices.oneIn(12) ? anyValue(choices) : each.value(choices));
    }
  }
}

PropertyDictionary account(Choices& choices) {
  const Kind& kind = choices.of(kKinds);
  PropertyDictionary account = {{"Type", kind.type}, {"Class", kind.accountClass}};
  if (!choices.oneIn(6)) {
    account.set("Identifier", identifier(choices));
  }
  if (choices.oneIn(24)) {
    account.remove(choices.flag() ? "Type" : "Class");
  }
  addProperties(choices, kAccountProperties, account);
  return account;
}

/// A list of a few dictionaries, seldom with something else among them.
PropertyArray listOf(Choices& choices, std::size_t most,
                     PropertyDictionary (*make)(Choices& choices)) {
  PropertyArray list;
  for (std::size_t count = choices.below(most + 1); count > 0; --count) {
    list.append(choices.oneIn(40) ? anyValue(choices) : PropertyValue(make(choices)));
  }
  return list;
}

PropertyDictionary accountWithChildren(Choices& choices) {
  PropertyDictionary parent = account(choices);
  if (choices.oneIn(3)) {
    parent.set("ChildAccounts", listOf(choices, 2, account));
  }
  return parent;
}

/// A description whose class stands under this key and whose identifier under that.
PropertyDictionary description(Choices& choices, std::string_view classKey,
                               std::string_view identifierKey,
                               std::span<const Property> properties) {
  PropertyDictionary description;
  if (!choices.oneIn(16)) {
    description.set(classKey, someClass(choices));
  }
  if (!choices.oneIn(5)) {
    description.set(identifierKey, identifier(choices));
  }
  addProperties(choices, properties, description);
  return description;
}

PropertyDictionary mailDescription(Choices& choices) {
  return description(choices, "AccountType", "uniqueId", kMailProperties);
}

PropertyDictionary exchangeDescription(Choices& choices) {
  return description(choices, "DAAccountConfigurationClass", "DAAccountConfigurationAccountID",
                     kExchangeProperties);
}

/// Sets a list under a key; seldom none, or what is no list.
void setList(Choices& choices, PropertyDictionary& root, std::string_view key, std::size_t most,
             PropertyDictionary (*make)(Choices& choices)) {
  if (choices.oneIn(24)) {
    root.set(key, anyValue(choices));
  } else if (!choices.oneIn(16)) {
    root.set(key, listOf(choices, most, make));
  }
}

}  // namespace

PropertyValue anyValue(Choices& choices) {
  return valueUpTo(choices, 2);
}

PropertyDictionary generatedSettings(Choices& choices) {
  constexpr std::size_t kVersions = 14;
  PropertyDictionary root;
  if (!choices.oneIn(8)) {
    root.set("Version", choices.below(kVersions));
  } else if (!choices.oneIn(3)) {
    root.set("Version", anyValue(choices));
  }
  setList(choices, root, "Accounts", 5, accountWithChildren);
  if (choices.oneIn(10)) {
    root.set("A key that nobody knows", anyValue(choices));
  }
  return root;
}

PropertyDictionary generatedLegacyMail(Choices& choices) {
  PropertyDictionary root;
  setList(choices, root, "MailAccounts", 3, mailDescription);
  setList(choices, root, "DeliveryAccounts", 2, mailDescription);
  return root;
}

PropertyDictionary generatedLegacyExchange(Choices& choices) {
  PropertyDictionary root;
  setList(choices, root, "DAAccountsKey", 3, exchangeDescription);
  return root;
}

}  // namespace accounts
