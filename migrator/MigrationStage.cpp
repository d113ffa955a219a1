#include "migrator/MigrationStage.h"

#include <optional>
#include <vector>

#include "accountsettings/Process.h"

namespace accounts {

namespace {

MigrationObserver* observer() {
  return Process::current().platform.migrationObserver;
}

std::vector<AccountOrigin> originsOf(const AccountsManager& store) {
  std::vector<AccountOrigin> origins;
  origins.reserve(store.allBasicAccounts().size());
  for (const BasicAccountReference& account : store.allBasicAccounts()) {
    origins.push_back(account->origin());
  }
  return origins;
}

AccountsInMemory accountsOf(const AccountsManager& store) {
  std::vector<PropertyValue> accounts;
  accounts.reserve(store.allBasicAccounts().size());
  for (const BasicAccountReference& account : store.allBasicAccounts()) {
    accounts.emplace_back(account->propertiesToSave());
  }
  return {{{kPlistAccountsKey, PropertyArray(std::move(accounts))},
           {kPlistVersionKey, store.dataVersion()}},
          originsOf(store)};
}

}  // namespace

void tellFate(const AccountEvent& event) {
  if (MigrationObserver* const told = observer()) {
    told->accountFared(event);
  }
}

void tellSavedAccounts(const AccountsManager& store) {
  if (MigrationObserver* const told = observer()) {
    told->accountsSaved(originsOf(store));
  }
}

void nameMadeAccount(BasicAccount& account) {
  account.setOrigin({AccountOrigin::Kind::Made, ++Process::current().madeAccounts});
}

MigrationStage::MigrationStage(std::string_view operation, std::string_view purpose) {
  if (MigrationObserver* const told = observer()) {
    told->stageBegan(operation, purpose);
  }
}

void MigrationStage::end(bool succeeded, const AccountsManager* store) {
  if (MigrationObserver* const told = observer()) {
    told->stageEnded(succeeded, store != nullptr && told->wantsAccounts()
                                    ? std::optional(accountsOf(*store))
                                    : std::nullopt);
  }
}

}  // namespace accounts
