#include <array>

#include "migrator/AccountsDataMigrator.h"
#include "migrator/CalDAVMatching.h"
#include "migrator/MailAccountClasses.h"

// The step of 7A242: mail and notes for web-mail accounts, and their calendars folded into them.

namespace accounts {

namespace {

constexpr std::array webMailClasses = {imapAccountClass, gmailAccountClass, yahooAccountClass,
                                       aolAccountClass, velmoraAccountClass};

/// A mail service whose accounts take stand-alone CalDAV accounts in, and the type that its
/// accounts get.
struct UmbrellaService {
  std::string_view accountClass;
  std::string_view type;
};

const std::array<UmbrellaService, 2> umbrellaServices = {{
    {gmailAccountClass, kGmailAccountType},
    {yahooAccountClass, kYahooAccountType},
}};

/// The stand-alone CalDAV accounts of a store, in order, and how many umbrella accounts took each
/// one in.
class CalDAVAccounts {
 public:
  explicit CalDAVAccounts(const AccountsManager::Accounts& all)
      : accounts_(amongAll(all)), index_(endpointsOf(accounts_)) {}

  /// Counts a match for each account that is the calendar half of an umbrella account. True when
  /// there is one.
  bool countMatches(const BasicAccount& umbrellaAccount) {
    return index_.countMatches(expectedCalDAVOf(umbrellaAccount));
  }

  /// Deletes from the store each account once for each umbrella account that matched it.
  void deleteMatchedAccounts(AccountsManager& store) const {
    for (std::size_t position = 0; position < accounts_.size(); ++position) {
      deleteRepeatedly(store, accounts_[position], index_.timesMatched(position));
    }
  }

 private:
  static AccountsManager::Accounts amongAll(const AccountsManager::Accounts& all) {
    AccountsManager::Accounts calDAVAccounts;
    for (const BasicAccountReference& account : all) {
      if (hasClass(*account, calDAVAccountClass)) {
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

  // A repeated deletion counts: each removes one more account where several share an identifier.
  // Once a deletion finds nothing, neither do the later ones, so they are left out; otherwise a
  // file in which all umbrella accounts match all CalDAV accounts would cost a deletion for every
  // pair. Deletions of different identifiers do not affect each other, so going through the
  // accounts in order instead of through the pairs changes nothing but the order of log lines.
  static void deleteRepeatedly(AccountsManager& store, const BasicAccountReference& account,
                               std::size_t times) {
    for (std::size_t deletion = 0; deletion < times; ++deletion) {
      const std::uint64_t countBefore = store.count();
      store.deleteAccount(account);
      if (store.count() == countBefore) {
        return;
      }
    }
  }

  AccountsManager::Accounts accounts_;
  CalDAVIndex index_;
};

void enableMailAndNotes(BasicAccount& account) {
  constexpr bool activeIfAbsent = true;
  if (hasClassAmong(account, webMailClasses) &&
      account.booleanPropertyForKey(isActiveKey).value_or(activeIfAbsent)) {
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
    for (const UmbrellaService& service : umbrellaServices) {
      if (!hasClass(*account, service.accountClass)) {
        continue;
      }
      // Forced, because the ordinary setter refuses "Type"; before the calendars are switched on,
      // because the type decides whether they can be.
      account->_forcedSetAccountProperty_forKey(service.type, kAccountType);
      // Kept on purpose: an inactive account takes its calendars in as well.
      if (calDAVAccounts.countMatches(*account)) {
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
