#include "bench/AccountKinds.h"

#include <array>

#include "vocabulary/AccountVocabulary.h"

namespace accounts {

namespace {

using DataclassList = std::vector<std::string_view>;

AccountKind ofMail(std::string_view type, std::string_view accountClass,
                   std::string_view displayName, std::string_view host,
                   std::string_view mailDirectoryPrefix, Activity activity) {
  return {.type = type,
          .accountClass = accountClass,
          .displayName = displayName,
          .host = host,
          .mailDirectoryPrefix = mailDirectoryPrefix,
          .enabledDataclasses = {kAccountDataclassMail},
          .activity = activity,
          .identifiers = Identifiers::CurrentAndOldest};
}

AccountKind ofHostedService(std::string_view accountClass, std::string_view host,
                            std::string_view mailDirectoryPrefix, Activity activity) {
  AccountKind kind =
      ofMail(kVelmoraAccountType, accountClass, "Velmora", host, mailDirectoryPrefix, activity);
  kind.enabledDataclasses = {kAccountDataclassMail, kAccountDataclassContacts,
                             kAccountDataclassCalendars, kAccountDataclassBookmarks,
                             kAccountDataclassNotes};
  kind.children = Children::Calendars;
  return kind;
}

AccountKind ofCloud(int status, Children children, DataclassList dataclasses) {
  return {.type = kQuarxAccountType,
          .accountClass = "ZQAccount",
          .displayName = "Velmora",
          .host = "setup.velmora.example",
          .enabledDataclasses = std::move(dataclasses),
          .provisionedDataclasses = {kAccountDataclassContacts, kAccountDataclassReminders,
                                     kAccountDataclassBookmarks, kAccountDataclassDeviceLocator,
                                     kAccountDataclassUbiquity, kAccountDataclassKeyValue},
          .children = children,
          .status = status};
}

AccountKind ofService(std::string_view type, std::string_view accountClass,
                      std::string_view displayName, std::string_view host,
                      DataclassList dataclasses) {
  return {.type = type,
          .accountClass = accountClass,
          .displayName = displayName,
          .host = host,
          .enabledDataclasses = std::move(dataclasses)};
}

AccountKind ofCalDAV(std::string_view displayName, std::string_view host, Calendars calendars,
                     Children children) {
  AccountKind kind = ofService(kCalDAVAccountType, "MobileCalDAVAccount", displayName, host,
                               {kAccountDataclassCalendars});
  kind.calendars = calendars;
  kind.children = children;
  return kind;
}

AccountKind ofExchange(std::string_view displayName, std::string_view host) {
  AccountKind kind =
      ofService(kExchangeAccountType, "ASAccount", displayName, host,
                {kAccountDataclassMail, kAccountDataclassContacts, kAccountDataclassCalendars});
  kind.identifiers = Identifiers::CurrentAndOldest;
  return kind;
}

}  // namespace

std::span<const AccountKind> accountKinds() {
  static const std::array<AccountKind, 28> kinds = {{
      ofMail(kMailAccountType, "IMAPAccount", "Work", "imap.example.org", "IMAP-",
             Activity::Active),
      ofMail(kMailAccountType, "GmailAccount", "Gmail", "imap.gmail.com", "IMAP-",
             Activity::Unsaid),
      ofCalDAV("Gmail calendars", "www.google.com", Calendars::GoogleOfPrevious, Children::None),
      ofMail(kSMTPAccountType, "SMTPAccount", "Outgoing", "smtp.example.org", "", Activity::Unsaid),
      ofHostedService("VelmoraAccount", "mail.velmora.example", "Velmora-", Activity::Active),
      ofMail(kMailAccountType, "YahooAccount", "Yahoo!", "imap.mail.yahoo.com", "IMAP-",
             Activity::Active),
      ofCalDAV("Yahoo! calendars", "caldav.calendar.yahoo.com", Calendars::YahooOfPrevious,
               Children::None),
      ofExchange("Company", "exchange.example.org"),
      ofCloud(2, Children::MailAndCalendars,
              {kAccountDataclassContacts, kAccountDataclassReminders}),
      ofService(kSubscribedCalendarAccountType, "SubscribedCalendarAccount", "Public holidays",
                "calendar.example.org", {kAccountDataclassCalendars}),
      ofMail(kMailAccountType, "POPAccount", "Old mail", "pop.example.net", "POP-",
             Activity::Inactive),
      ofCloud(
          2, Children::None,
          {kAccountDataclassContacts, kAccountDataclassBookmarks, kAccountDataclassDeviceLocator}),
      ofHostedService("MarrowAccount", "mail.marrow.example", "Dorsa-", Activity::Unsaid),
      ofCalDAV("Club", "caldav.example.org", Calendars::OwnServer, Children::None),
      ofService(kCardDAVAccountType, "MobileCardDAVAccount", "Address book", "carddav.example.org",
                {kAccountDataclassContacts}),
      ofMail(kMailAccountType, "AOLAccount", "AOL", "imap.aol.example", "AOL-", Activity::Unsaid),
      ofCloud(1, Children::MailAndCalendars,
              {kAccountDataclassContacts, kAccountDataclassReminders, kAccountDataclassUbiquity,
               kAccountDataclassKeyValue}),
      ofService(kBookmarkDAVAccountType, "MobileBookmarkDAVAccount", "Bookmarks",
                "bookmarks.example.org", {kAccountDataclassBookmarks}),
      // Its class is only found again from its mail directory.
      ofMail(kMailAccountType, "MailAccount", "Older mail", "pop.example.org", "POP-",
             Activity::Active),
      ofService(kLDAPAccountType, "LDAPAccount", "Directory", "ldap.example.org",
                {kAccountDataclassContactsSearch}),
      ofCalDAV("Work calendars", "calendar.example.com", Calendars::OwnServer, Children::Calendars),
      ofService(kIMAPNotesAccountType, "IMAPNotesAccount", "Notes", "notes.example.org",
                {kAccountDataclassNotes}),
      ofMail(kGmailAccountType, "GmailAccount", "Second Gmail", "imap.gmail.com", "IMAP-",
             Activity::Inactive),
      ofMail(kYahooAccountType, "YahooAccount", "Second Yahoo!", "imap.mail.yahoo.com", "IMAP-",
             Activity::Active),
      ofMail(kMailAccountType, "IMAPAccount", "Home", "imap.example.net", "IMAP-",
             Activity::Unsaid),
      ofExchange("School", "exchange.example.com"),
      ofCloud(1, Children::Calendars, {kAccountDataclassContacts, kAccountDataclassBookmarks}),
      [] {
        AccountKind kind = ofService(kTolvaneIMAPAccountType, "TolvaneIMAPAccount", "Stratix mail",
                                     "imap.stratix.example", {kAccountDataclassMail});
        kind.children = Children::Calendars;
        return kind;
      }(),
  }};
  return kinds;
}

const AccountKind& deviceLocalAccountKind() {
  static const AccountKind kind =
      ofService(kOnMyDeviceAccountType, "DeviceLocalAccount", "On This Device", "",
                {kAccountDataclassCalendars, kAccountDataclassContacts});
  return kind;
}

}  // namespace accounts
