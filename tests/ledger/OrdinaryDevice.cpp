#include "tests/ledger/OrdinaryDevice.h"

#include <array>

namespace accounts {

DeviceFiles OrdinaryDevice::make() {
  DeviceFiles files;
  const bool hasMailStore = chance(40);
  const bool hasExchangeStore = chance(30);
  if (chance(90)) {
    PropertyArray accounts;
    for (unsigned count = below(7); count > 0; --count) {
      accounts.append(account(hasMailStore, hasExchangeStore));
    }
    if (chance(50)) {
      accounts.append(filled({{kAccountIdentifier, "DeviceLocalAccount"},
                              {kAccountType, kOnMyDeviceAccountType},
                              {kAccountClass, "DeviceLocalAccount"},
                              {kAccountEnabledDataclasses, dataclasses()}}));
    }
    files.settings = accountSettings(static_cast<int>(below(13)), std::move(accounts));
  }
  if (hasMailStore) {
    constexpr std::array kIncoming = {
        kIMAPAccountClass,  kPOPAccountClass,     kAOLAccountClass,    kGmailAccountClass,
        kYahooAccountClass, kVelmoraAccountClass, kMarrowAccountClass, kTolvaneIMAPAccountClass};
    constexpr std::array kOutgoing = {kSMTPAccountClass, kDeliveryAccountClass};
    PropertyArray in;
    PropertyArray out;
    for (unsigned count = below(3); count > 0; --count) {
      in.append(description(kLegacyMailIdentifier, kLegacyMailClass,
                            kIncoming[below(kIncoming.size())], kLegacyMailDisplayName));
    }
    for (unsigned count = below(3); count > 0; --count) {
      out.append(description(kLegacyMailIdentifier, chance(80) ? kLegacyMailClass : "",
                             kOutgoing[below(kOutgoing.size())], kLegacyMailDisplayName));
    }
    files.mail = mailStore(std::move(in), std::move(out));
  }
  if (hasExchangeStore) {
    PropertyArray descriptions;
    for (unsigned count = below(3); count > 0; --count) {
      PropertyDictionary each = description(kLegacyExchangeIdentifier, kLegacyExchangeClass,
                                            "ASAccount", kLegacyExchangeDisplayName);
      for (const std::string_view key : kLegacyExchangeSwitches) {
        if (chance(40)) {
          each.set(key, chance(50));
        }
      }
      descriptions.append(std::move(each));
    }
    files.exchange = exchangeStore(std::move(descriptions));
  }
  return files;
}

PropertyDictionary OrdinaryDevice::account(bool mailStore, bool exchangeStore) {
  struct Shape {
    std::string_view type;
    std::string_view accountClass;
  };
  // Gmail and Yahoo accounts are of the type of mail accounts before a step tells them apart.
  static const std::array anywhere = {
      Shape{kCalDAVAccountType, kCalDAVAccountClass},
      Shape{kCardDAVAccountType, "CardDAVAccount"},
      Shape{kLDAPAccountType, "LDAPAccount"},
      Shape{kSubscribedCalendarAccountType, "SubCalAccount"},
      Shape{kGmailAccountType, kGmailAccountClass},
      Shape{kYahooAccountType, kYahooAccountClass},
      Shape{kVelmoraAccountType, kVelmoraAccountClass},
      Shape{kVelmoraAccountType, kMarrowAccountClass},
      Shape{kQuarxAccountType, kCloudAccountClass},
      Shape{kTolvaneIMAPAccountType, kTolvaneIMAPAccountClass},
  };
  static const std::array withoutStore = {
      Shape{kMailAccountType, kIMAPAccountClass},  Shape{kMailAccountType, kPOPAccountClass},
      Shape{kMailAccountType, kGmailAccountClass}, Shape{kMailAccountType, kYahooAccountClass},
      Shape{kSMTPAccountType, kSMTPAccountClass},
  };
  Shape shape = anywhere[below(anywhere.size())];
  if (!mailStore && chance(40)) {
    shape = withoutStore[below(withoutStore.size())];
  } else if (!exchangeStore && chance(15)) {
    shape = {kExchangeAccountType, "ASAccount"};
  }
  PropertyDictionary made = {{kAccountType, shape.type}, {kAccountClass, shape.accountClass}};
  if (chance(90)) {
    made.set(kAccountIdentifier, freshText());
  }
  if (chance(20)) {
    made.set(kLegacyMailIdentifier, freshText());
  }
  // A calendar account that is joined into its mail account takes its children along.
  if (shape.accountClass != kCalDAVAccountClass && chance(15)) {
    PropertyArray children;
    for (unsigned count = below(3); count > 0; --count) {
      children.append(
          filled({{kAccountIdentifier, freshText()},
                  {kAccountType, chance(50) ? kVelmoraAccountType : kCalDAVAccountType},
                  {kAccountClass, chance(50) ? kVelmoraAccountClass : kCalDAVAccountClass}}));
    }
    made.set(kAccountChildAccounts, PropertyArray(std::move(children)));
  }
  return filled(std::move(made));
}

PropertyDictionary OrdinaryDevice::filled(PropertyDictionary account) {
  if (chance(60)) {
    account.set(kAccountDisplayName, chance(10) ? std::string("Velmora") : freshText());
  }
  if (chance(60)) {
    account.set(kAccountUsername, chance(30) ? "jo" : chance(50) ? "jo@host" : "kim");
  }
  if (chance(60)) {
    account.set(kAccountEnabledDataclasses, dataclasses());
  }
  if (chance(20)) {
    account.set(kAccountProvisionedDataclasses, dataclasses());
  }
  if (chance(30)) {
    account.set(kIsActiveKey, chance(50));
  }
  if (chance(30)) {
    account.set("status", static_cast<std::int64_t>(below(3)));
  }
  if (chance(20)) {
    account.set("primaryAccount", chance(50));
  }
  if (account.textForKey(kAccountClass) == std::optional<Text>(kCalDAVAccountClass) && chance(60)) {
    const bool google = chance(50);
    account.set("CalDAVPrincipalConfiguration",
                PropertyDictionary{{"Login_Key", "jo"},
                                   {"CalDAV_Server_Key",
                                    google ? "www.google.com" : "caldav.calendar.yahoo.com"}});
    account.set("CalDAVAccountConfiguration",
                PropertyDictionary{{"CalDAV_PrincipalPath_Key",
                                    google ? "/calendar/dav/jo/user" : "/principals/users/jo"}});
  }
  for (unsigned count = below(4); count > 0; --count) {
    account.set("Key " + std::to_string(below(30)), value(2));
  }
  return account;
}

PropertyDictionary OrdinaryDevice::description(std::string_view identifierKey,
                                               std::string_view classKey,
                                               std::string_view accountClass,
                                               std::string_view nameKey) {
  PropertyDictionary made;
  if (!classKey.empty()) {
    made.set(classKey, accountClass);
  }
  if (chance(85)) {
    made.set(identifierKey, freshText());
  }
  if (chance(70)) {
    made.set(nameKey, freshText());
  }
  if (chance(70)) {
    made.set(kAccountUsername, chance(50) ? "jo" : "jo@host");
  }
  for (unsigned count = below(4); count > 0; --count) {
    made.set("Key " + std::to_string(below(30)), value(2));
  }
  return made;
}

std::string OrdinaryDevice::freshText() {
  return "T" + std::to_string(++texts_);
}

PropertyValue OrdinaryDevice::value(int depth) {
  switch (below(depth > 0 ? 8 : 6)) {
    case 0:
      return freshText();
    case 1:
      return static_cast<std::int64_t>(below(1000)) - 500;
    case 2:
      return chance(50);
    case 3:
      return 0.25 * below(100);
    case 4:
      return PropertyDate{1000.5 * below(100)};
    case 5:
      return PropertyData("\x01\xff data");
    case 6:
      return PropertyArray{value(depth - 1), value(depth - 1)};
    default:
      return PropertyDictionary{{"inner", value(depth - 1)}};
  }
}

PropertyArray OrdinaryDevice::dataclasses() {
  static const std::array all = {
      kAccountDataclassMail,      kAccountDataclassContacts,  kAccountDataclassCalendars,
      kAccountDataclassReminders, kAccountDataclassBookmarks, kAccountDataclassNotes,
      kAccountDataclassUbiquity,  kAccountDataclassKeyValue,  kAccountDataclassDeviceLocator};
  PropertyArray made;
  for (const std::string_view each : all) {
    if (chance(40)) {
      made.append(each);
    }
  }
  return made;
}

}  // namespace accounts
