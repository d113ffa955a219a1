#include <array>
#include <utility>

#include "migrator/AccountsDataMigrator.h"
#include "migrator/CalDAVMatching.h"
#include "migrator/HasClass.h"
#include "migrator/MigrationStage.h"

// The step of 7A242: mail and notes for web-mail accounts, and their calendars folded into them.

namespace accounts {

namespace {

constexpr std::array kWebMailClasses = {kIMAPAccountClass, kGmailAccountClass, kYahooAccountClass,
                                        kAOLAccountClass, kVelmoraAccountClass};

/// A mail service whose accounts take stand-alone CalDAV accounts in, and the type that its
/// accounts get.
struct UmbrellaService {
  std::string_view accountClass;
  std::string_view type;
};

const std::array<UmbrellaService, 2> kUmbrellaServices = {{
    {kGmailAccountClass, kGmailAccountType},
    {kYahooAccountClass, kYahooAccountType},
}};

/// The stand-alone CalDAV accounts of a store, in order, and those of them that umbrella accounts
/// took in.
class CalDAVAccounts {
 public:
  explicit CalDAVAccounts(const AccountsManager::Accounts& all)
      : accounts_(amongAll(all)), index_(endpointsOf(accounts_)) {}

  /// Notes the accounts that are the calendar half of an umbrella account, as it is now. True when
  /// there is one.
  bool noteMatches(const BasicAccount& umbrellaAccount) {
    ExpectedCalDAV expected = expectedCalDAVOf(umbrellaAccount);
    if (index_.matches(expected).empty()) {
      return false;
    }
    matches_.push_back({std::move(expected), umbrellaAccount.origin()});
    return true;
  }

  // Kept on purpose: a repeated deletion counts. Each removes one more account where several share
  // an identifier, and each writes its line.
  /// Deletes from the store the accounts that each umbrella account matched, umbrella account by
  /// umbrella account: each account as often as it was matched.
  void deleteMatchedAccounts(AccountsManager& store) const {
    for (const Match& match : matches_) {
      // Looked up again: a list of all matches would be as long as there are pairs.
      for (const std::size_t position : index_.matches(match.expected)) {
        tellFate({accounts_[position]->origin(), ToldFate::Joined, match.umbrella});
        store.deleteAccount(accounts_[position]);
      }
    }
  }

 private:
  static AccountsManager::Accounts amongAll(const AccountsManager::Accounts& all) {
    AccountsManager::Accounts calDAVAccounts;
    for (const BasicAccountReference& account : all) {
      if (hasClass(*account, kCalDAVAccountClass)) {
        calDAVAccounts.push_back(account);
      }
    }
    return calDAVAccounts;
  }

  static std::vector<CalDAVEndpoint> endpointsOf(const AccountsManager::Accounts& accounts) {
    std::vector<CalDAVEndpoint> endpoints;
    endpoints.reserve(accounts.size());
    for (const BasicAccountReference& account : accounts) {
      endpoints.push_back(calDAVEndpointOf(*account));
    }
    return endpoints;
  }

  AccountsManager::Accounts accounts_;
  CalDAVIndex index_;
  struct Match {
    ExpectedCalDAV expected;
    AccountOrigin umbrella;
  };
  std::vector<Match> matches_;
};

void enableMailAndNotes(BasicAccount& account) {
  constexpr bool kActiveIfAbsent = true;
  if (hasClassAmong(account, kWebMailClasses) &&
      account.booleanPropertyForKey(kIsActiveKey).value_or(kActiveIfAbsent)) {
    account.setEnabled_forDataclass(true, kAccountDataclassMail);
    account.setEnabled_forDataclass(true, kAccountDataclassNotes);
  }
}

}  // namespace

bool AccountsDataMigrator::_migrateAccountsFrom7A242(AccountsManager& store) {
  const AccountsManager::Accounts& all = store.allBasicAccounts();
  CalDAVAccounts calDAVAccounts(all);
  for (const BasicAccountReference& account : all) {
    enableMailAndNotes(*account);
    for (const UmbrellaService& service : kUmbrellaServices) {
      if (!hasClass(*account, service.accountClass)) {
        continue;
      }
      // Forced, because the ordinary setter refuses "Type"; before the calendars are switched on,
      // because the type decides whether they can be.
      account->_forcedSetAccountProperty_forKey(service.type, kAccountType);
      // Kept on purpose: an inactive account takes its calendars in as well.
      if (calDAVAccounts.noteMatches(*account)) {
        account->setEnabled_forDataclass(true, kAccountDataclassCalendars);
      }
    }
  }
  // Only now, since the store's own list was walked above.
  calDAVAccounts.deleteMatchedAccounts(store);
  store.setDataVersion(5);
  return true;
}

}  // namespace accounts
