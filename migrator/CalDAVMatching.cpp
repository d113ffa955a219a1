#include "migrator/CalDAVMatching.h"

#include <algorithm>
#include <array>

#include "accountsettings/MailServices.h"
#include "migrator/AccountsDataMigrator.h"
#include "migrator/HasClass.h"
#include "migrator/URLEscaping.h"

namespace accounts {

namespace {

/// A mail service with calendars: where they are, and the principal path of a user there.
struct CalendarService {
  std::string_view accountClass;
  std::string MailServices::*host;
  std::string_view pathBeforeUsername;
  std::string_view pathAfterUsername;
};

constexpr std::array<CalendarService, 2> kCalendarServices = {{
    {kGmailAccountClass, &MailServices::googleCalDAVHost, "/calendar/dav/", "/user"},
    {kYahooAccountClass, &MailServices::yahooCalDAVHost, "/principals/users/", ""},
}};

/// The calendar service of an account's class, null for none.
const CalendarService* calendarServiceOf(const BasicAccount& account) {
  const auto* const service = std::ranges::find_if(
      kCalendarServices,
      [&](const CalendarService& candidate) { return hasClass(account, candidate.accountClass); });
  return service != kCalendarServices.end() ? service : nullptr;
}

std::optional<Text> textInDictionary(const BasicAccount& account, std::string_view dictionaryKey,
                                     std::string_view key) {
  const std::optional<PropertyDictionary> dictionary =
      account.dictionaryPropertyForKey(dictionaryKey);
  return dictionary ? dictionary->textForKey(key) : std::nullopt;
}

}  // namespace

CalDAVEndpoint calDAVEndpointOf(const BasicAccount& calDAVAccount) {
  constexpr std::string_view kPrincipalKey = "CalDAVPrincipalConfiguration";
  constexpr std::string_view kAccountKey = "CalDAVAccountConfiguration";
  return {
      .server = textInDictionary(calDAVAccount, kPrincipalKey, "CalDAV_Server_Key"),
      .login = textInDictionary(calDAVAccount, kPrincipalKey, "Login_Key"),
      .principalPath = textInDictionary(calDAVAccount, kAccountKey, "CalDAV_PrincipalPath_Key")};
}

ExpectedCalDAV expectedCalDAVOf(const BasicAccount& umbrellaAccount) {
  using Migrator = AccountsDataMigrator;
  return {.host = Migrator::_expectedCalDAVHostnameForAccount(umbrellaAccount),
          .logins = Migrator::_expectedCalDAVUsernamesForAccount(umbrellaAccount),
          .principalPaths = Migrator::_expectedCalDAVPrincipalURLsForAccount(umbrellaAccount)};
}

std::string AccountsDataMigrator::_urlSafeUsername(std::string_view username) {
  return urlEscapedComponent(username);
}

std::vector<std::string> AccountsDataMigrator::_expectedCalDAVUsernamesForAccount(
    const BasicAccount& account) {
  const std::optional<Text> username = account.textPropertyForKey(kAccountUsername);
  if (!username) {
    return {};
  }
  std::vector<std::string> usernames = {username->string()};
  const std::size_t domainStart = username->view().find('@');
  if (domainStart != std::string_view::npos) {
    usernames.emplace_back(username->view().substr(0, domainStart));
  }
  return usernames;
}

std::optional<std::string> AccountsDataMigrator::_expectedCalDAVHostnameForAccount(
    const BasicAccount& account) {
  const CalendarService* const service = calendarServiceOf(account);
  if (service == nullptr) {
    return std::nullopt;
  }
  return MailServices::current().*service->host;
}

std::vector<std::string> AccountsDataMigrator::_expectedCalDAVPrincipalURLsForAccount(
    const BasicAccount& account) {
  const CalendarService* const service = calendarServiceOf(account);
  if (service == nullptr) {
    return {};
  }
  std::vector<std::string> urls = _expectedCalDAVUsernamesForAccount(account);
  for (std::string& url : urls) {
    url = std::string(service->pathBeforeUsername) + _urlSafeUsername(url) +
          std::string(service->pathAfterUsername);
  }
  return urls;
}

bool AccountsDataMigrator::_calDAVAccount_matchesUmbrellaAccount(
    const BasicAccount& calDAVAccount, const BasicAccount& umbrellaAccount) {
  return !CalDAVIndex({calDAVEndpointOf(calDAVAccount)})
              .matches(expectedCalDAVOf(umbrellaAccount))
              .empty();
}

}  // namespace accounts
