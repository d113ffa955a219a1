#include "bench/AccountGenerator.h"

#include <algorithm>
#include <array>
#include <string>
#include <utility>
#include <vector>

#include "bench/AccountKinds.h"
#include "bench/NumberSequence.h"
#include "vocabulary/AccountVocabulary.h"

namespace accounts {

namespace {

constexpr std::array<std::string_view, 8> firstNames = {"ada",   "bela", "chiara", "dov",
                                                        "edith", "femi", "grace",  "henk"};
constexpr std::array<std::string_view, 8> lastNames = {"lindqvist", "moreau", "nakamura", "okafor",
                                                       "petrova",   "quist",  "rossi",    "santos"};

/// Purposes of the number sequences of one account, so that none repeats another's numbers.
enum class Purpose : std::uint64_t { Account, FirstChild, LegacyMail, LegacyDelivery, Exchange };

NumberSequence sequenceFor(std::size_t index, Purpose purpose) {
  constexpr std::uint64_t purposeCount = 16;
  return NumberSequence(index * purposeCount + static_cast<std::uint64_t>(purpose));
}

PropertyArray textsOf(const std::vector<std::string_view>& texts) {
  return PropertyArray(std::vector<PropertyValue>(texts.begin(), texts.end()));
}

/// The name that the owner of an account has on its server; no two accounts share one.
std::string ownerName(std::size_t index) {
  return std::string(firstNames[index % firstNames.size()]) + "." +
         std::string(lastNames[index / firstNames.size() % lastNames.size()]) +
         std::to_string(index);
}

bool isMail(const AccountKind& kind) {
  return !kind.mailDirectoryPrefix.empty() || kind.type == kSMTPAccountType;
}

std::string usernameOf(const AccountKind& kind, std::size_t index) {
  // The hosted service's mail accounts have always stored bare names.
  const bool isBare = kind.type == kVelmoraAccountType;
  return isBare ? ownerName(index)
                : ownerName(index) + "@" + std::string(kind.host.substr(kind.host.find('.') + 1));
}

/// A dictionary that grows entry by entry and is sorted once.
class DictionaryBuilder {
 public:
  void set(std::string_view key, PropertyValue value) {
    entries_.push_back({Text(key), std::move(value)});
  }
  PropertyDictionary build() && { return PropertyDictionary(std::move(entries_)); }

 private:
  std::vector<KeyedValue> entries_;
};

PropertyDictionary principalConfiguration(const AccountKind& kind, const std::string& login) {
  return {{"Login_Key", login},
          {"CalDAV_Server_Key", kind.host},
          {"CalDAV_Port_Key", 443},
          {"CalDAV_UseSSL_Key", true}};
}

std::string principalPath(const AccountKind& kind, const std::string& owner) {
  switch (kind.calendars) {
    case Calendars::GoogleOfPrevious:
      return "/calendar/dav/" + owner + "/user";
    case Calendars::YahooOfPrevious:
      return "/principals/users/" + owner;
    case Calendars::OwnServer:
    case Calendars::None:
      break;
  }
  return "/principals/" + owner;
}

void addCalendars(DictionaryBuilder& account, const AccountKind& kind, std::size_t index) {
  if (kind.calendars == Calendars::None) {
    return;
  }
  const bool isOwnServer = kind.calendars == Calendars::OwnServer;
  const std::string owner = ownerName(isOwnServer ? index : index - 1);
  account.set("CalDAVPrincipalConfiguration", principalConfiguration(kind, owner));
  account.set("CalDAVAccountConfiguration",
              PropertyDictionary{{"CalDAV_PrincipalPath_Key", principalPath(kind, owner)},
                                 {"CalDAV_SupportsFreebusy_Key", true}});
}

void addMail(DictionaryBuilder& account, const AccountKind& kind, const std::string& username) {
  if (!isMail(kind)) {
    return;
  }
  account.set("EmailAddresses", PropertyArray{username});
  account.set("AuthenticationScheme", "Password");
  account.set("StoredMessages",
              PropertyDictionary{{"Drafts", "Drafts"}, {"Sent", "Sent"}, {"Trash", "Trash"}});
  if (!kind.mailDirectoryPrefix.empty()) {
    account.set("AccountPath", "/var/mobile/Library/Mail/" + std::string(kind.mailDirectoryPrefix) +
                                   username + "@" + std::string(kind.host));
  }
  if (kind.activity != Activity::Unsaid) {
    account.set("IsActive", kind.activity == Activity::Active);
  }
}

void addServer(DictionaryBuilder& account, const AccountKind& kind, const std::string& username,
               NumberSequence& numbers) {
  account.set(kAccountUsername, username);
  account.set("Hostname", kind.host);
  account.set("PortNumber", 100 + static_cast<int>(numbers.below(900)));
  account.set("SSLEnabled", true);
  account.set("FullUserName", "Owner of " + username);
  account.set("LastCheck", PropertyDate{static_cast<double>(numbers.below(400'000'000))});
  account.set("CheckInterval", 0.5 * static_cast<double>(numbers.below(4)));
  account.set("Signature", "Sent from the device of " + username);
  account.set("ServerAddress", "https://" + std::string(kind.host) + "/accounts/" + username + "/");
  account.set("SyncToken", PropertyData(numbers.bytes(48)));
  account.set("ServerState",
              PropertyDictionary{{"Generation", static_cast<int>(numbers.below(1000))},
                                 {"Flags", PropertyArray{"quota", "idle"}},
                                 {"Session", numbers.identifier()},
                                 {"Limits", PropertyDictionary{{"Messages", 200}, {"Days", 30}}}});
}

PropertyDictionary childAccount(const AccountKind& kind, std::size_t index,
                                NumberSequence& numbers) {
  const std::string identifier = numbers.identifier();
  return {{kAccountIdentifier, identifier},
          {kAccountSyncIdentifier, identifier},
          {kAccountType, kind.type},
          {kAccountClass, kind.accountClass},
          {kAccountDisplayName, kind.displayName},
          {kAccountUsername, usernameOf(kind, index)},
          {"Hostname", kind.host},
          {"PortNumber", 443},
          {"SSLEnabled", true},
          {kAccountEnabledDataclasses, textsOf(kind.enabledDataclasses)}};
}

void addChildren(DictionaryBuilder& account, const AccountKind& kind, std::size_t index) {
  static const AccountKind calendars = {.type = kCalDAVAccountType,
                                        .accountClass = "MobileCalDAVAccount",
                                        .displayName = "Calendars",
                                        .host = "caldav.velmora.example",
                                        .enabledDataclasses = {kAccountDataclassCalendars}};
  static const AccountKind mail = {.type = kVelmoraAccountType,
                                   .accountClass = "VelmoraAccount",
                                   .displayName = "Velmora",
                                   .host = "mail.velmora.example",
                                   .mailDirectoryPrefix = "Velmora-",
                                   .enabledDataclasses = {kAccountDataclassMail}};
  if (kind.children == Children::None) {
    return;
  }
  NumberSequence numbers = sequenceFor(index, Purpose::FirstChild);
  PropertyArray children;
  if (kind.children == Children::MailAndCalendars) {
    children.append(childAccount(mail, index, numbers));
  }
  children.append(childAccount(calendars, index, numbers));
  account.set(kAccountChildAccounts, std::move(children));
}

void addIdentifiers(DictionaryBuilder& account, const AccountKind& kind, NumberSequence& numbers) {
  account.set(kAccountIdentifier, numbers.identifier());
  if (kind.identifiers == Identifiers::CurrentAndOldest) {
    account.set("uniqueId", numbers.identifier());
  }
}

PropertyDictionary accountOf(const AccountKind& kind, std::size_t index) {
  NumberSequence numbers = sequenceFor(index, Purpose::Account);
  const std::string username = usernameOf(kind, index);
  DictionaryBuilder account;
  addIdentifiers(account, kind, numbers);
  account.set(kAccountType, kind.type);
  account.set(kAccountClass, kind.accountClass);
  account.set(kAccountDisplayName, kind.displayName);
  account.set(kAccountTypeString, kind.type);
  account.set(kAccountShortTypeString, kind.type);
  account.set(kAccountEnabledDataclasses, textsOf(kind.enabledDataclasses));
  if (!kind.provisionedDataclasses.empty()) {
    account.set(kAccountProvisionedDataclasses, textsOf(kind.provisionedDataclasses));
  }
  account.set(kAccountCalendarsWereMigrated, true);
  addServer(account, kind, username, numbers);
  addMail(account, kind, username);
  addCalendars(account, kind, index);
  if (kind.status) {
    account.set("status", *kind.status);
  }
  addChildren(account, kind, index);
  return std::move(account).build();
}

PropertyDictionary deviceLocalAccount() {
  const AccountKind& kind = deviceLocalAccountKind();
  return {{kAccountIdentifier, "DeviceLocalAccount"},
          {kAccountType, kind.type},
          {kAccountClass, kind.accountClass},
          {kAccountDisplayName, kind.displayName},
          {kAccountEnabledDataclasses, textsOf(kind.enabledDataclasses)}};
}

PropertyDictionary legacyMailDescription(const AccountKind& kind, std::size_t index,
                                         Purpose purpose) {
  NumberSequence numbers = sequenceFor(index, purpose);
  const std::string username = usernameOf(kind, index);
  DictionaryBuilder description;
  description.set("uniqueId", numbers.identifier());
  description.set("AccountType", kind.accountClass);
  description.set("AccountName", kind.displayName);
  addServer(description, kind, username, numbers);
  addMail(description, kind, username);
  return std::move(description).build();
}

std::vector<const AccountKind*> kindsOfIncomingMail() {
  std::vector<const AccountKind*> incoming;
  for (const AccountKind& kind : accountKinds()) {
    if (!kind.mailDirectoryPrefix.empty()) {
      incoming.push_back(&kind);
    }
  }
  return incoming;
}

const AccountKind& kindOfType(std::string_view type) {
  return *std::ranges::find(accountKinds(), type, &AccountKind::type);
}

}  // namespace

PropertyDictionary generatedAccountSettings(std::size_t accountCount, std::int64_t version) {
  const std::span<const AccountKind> kinds = accountKinds();
  std::vector<PropertyValue> accounts;
  accounts.reserve(accountCount);
  if (accountCount > 0) {
    accounts.emplace_back(deviceLocalAccount());
  }
  for (std::size_t index = 1; index < accountCount; ++index) {
    accounts.emplace_back(accountOf(kinds[(index - 1) % kinds.size()], index));
  }
  return {{kPlistVersionKey, version}, {kPlistAccountsKey, PropertyArray(std::move(accounts))}};
}

PropertyDictionary generatedLegacyMailAccounts(std::size_t accountCount) {
  const std::vector<const AccountKind*> kinds = kindsOfIncomingMail();
  std::vector<PropertyValue> incoming;
  for (std::size_t index = 0; index < accountCount; ++index) {
    incoming.emplace_back(
        legacyMailDescription(*kinds[index % kinds.size()], index, Purpose::LegacyMail));
  }
  const AccountKind& outgoingKind = kindOfType(kSMTPAccountType);
  std::vector<PropertyValue> outgoing;
  for (std::size_t index = 0; index < std::max<std::size_t>(accountCount / 2, 1); ++index) {
    outgoing.emplace_back(legacyMailDescription(outgoingKind, index, Purpose::LegacyDelivery));
  }
  return {{"MailAccounts", PropertyArray(std::move(incoming))},
          {"DeliveryAccounts", PropertyArray(std::move(outgoing))}};
}

PropertyDictionary generatedLegacyExchangeAccounts(std::size_t accountCount) {
  const AccountKind& kind = kindOfType(kExchangeAccountType);
  std::vector<PropertyValue> descriptions;
  for (std::size_t index = 0; index < accountCount; ++index) {
    NumberSequence numbers = sequenceFor(index, Purpose::Exchange);
    DictionaryBuilder description;
    description.set("DAAccountConfigurationAccountID", numbers.identifier());
    description.set("DAAccountConfigurationClass", kind.accountClass);
    description.set("DAAccountDescription", kind.displayName);
    description.set("DAAccountEnabledForEmail", index % 2 == 0);
    description.set("DAAccountEnabledForContactsSearch", index % 3 == 0);
    addServer(description, kind, usernameOf(kind, index), numbers);
    descriptions.emplace_back(std::move(description).build());
  }
  return {{"DAAccountsKey", PropertyArray(std::move(descriptions))}};
}

}  // namespace accounts
