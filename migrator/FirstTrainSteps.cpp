#include <array>

#include "accountsettings/DeviceLocalAccount.h"
#include "accountsettings/Log.h"
#include "accountsettings/Process.h"
#include "migrator/AccountsDataMigrator.h"
#include "migrator/HasClass.h"
#include "migrator/MigrationStage.h"
#include "vocabulary/LegacyStoreKeys.h"

// The steps of 7A149 to 7A241. That of 7A242 has a file of its own.

namespace accounts {

namespace {

constexpr std::string_view kDenyTetheredSource = "DenyTethered";
constexpr std::string_view kStep7A153Operation =
    "-[AccountsDataMigrator(Internal) _migrateAccountsFrom7A153:]";

/// The kinds of data that external sources may sync, with the service's names of them.
struct SyncedKind {
  std::string_view dataclass;
  SyncDataType dataType;
};

const std::array<SyncedKind, 4> kSyncedKinds = {{
    {kAccountDataclassBookmarks, SyncDataType::Bookmarks},
    {kAccountDataclassCalendars, SyncDataType::Calendars},
    {kAccountDataclassContacts, SyncDataType::Contacts},
    {kAccountDataclassNotes, SyncDataType::Notes},
}};

bool isEmpty(const std::optional<Text>& text) {
  return !text || text->empty();
}

/// Gives an account the identifier that the oldest builds kept under "uniqueId", or a fresh one if
/// it has neither.
void settleIdentifier(BasicAccount& account) {
  const std::optional<Text> uniqueId = account.properties().textForKey(kLegacyMailIdentifier);
  if (!isEmpty(uniqueId)) {
    account.setAccountProperty_forKey(*uniqueId, kAccountIdentifier);
    account.removeAccountPropertyForKey(kLegacyMailIdentifier);
  } else if (isEmpty(account.textPropertyForKey(kAccountIdentifier))) {
    account.setAccountProperty_forKey(BasicAccount::createNewAccountUID(), kAccountIdentifier);
  }
}

/// Keeps an account's identifier as the identifier of its sync store.
void separateSyncIdentifier(BasicAccount& account) {
  const std::optional<Text> identifier = account.textPropertyForKey(kAccountIdentifier);
  if (!isEmpty(identifier)) {
    account.setAccountProperty_forKey(*identifier, kAccountSyncIdentifier);
  }
}

/// Whether the on-device account may hold a kind of data beside the external sources of it.
bool belongsOnDevice(const SyncedKind& kind) {
  const ExternalSyncSourcesAnswer answer =
      Process::current().platform.externalSyncSources.copyEnabledSources(kind.dataType);
  if (answer.error && !answer.error->empty()) {
    // Kept on purpose: "retreiving" is how device logs have always spelt it.
    logToConsole("[%s]Error while retreiving external sources for dataclass %@ [%@]",
                 {kStep7A153Operation, kind.dataclass, *answer.error});
    return false;
  }
  if (!answer.sources || answer.sources->empty()) {
    return true;
  }
  return BasicAccount::multipleStoresSupportedByDataclass(kind.dataclass) &&
         !AccountsDataMigrator::_tetheredDisabledInSources(*answer.sources);
}

}  // namespace

bool AccountsDataMigrator::_migrateAccountsFrom7A149(AccountsManager& store) {
  store.setDataVersion(1);
  return true;
}

bool AccountsDataMigrator::_migrateAccountsFrom7A150(AccountsManager& store) {
  AccountsManager::Accounts synced =
      store.basicAccountsWithTypes({kVelmoraAccountType, kMailAccountType});
  const AccountsManager::Accounts exchange = store.basicAccountsWithTypes({kExchangeAccountType});
  synced.insert(synced.end(), exchange.begin(), exchange.end());
  for (const BasicAccountReference& account : synced) {
    // First, because the sync store is known under the identifier that may now be replaced.
    separateSyncIdentifier(*account);
    settleIdentifier(*account);
  }

  const AccountsManager::Accounts outgoing = store.basicAccountsWithTypes({kSMTPAccountType});
  for (const BasicAccountReference& account : outgoing) {
    settleIdentifier(*account);
  }

  store.replaceAccountsWithTypes_withAccounts(
      {kVelmoraAccountType, kMailAccountType, kExchangeAccountType}, synced);
  store.replaceAccountsWithTypes_withAccounts({kSMTPAccountType}, outgoing);
  store.setDataVersion(2);
  return true;
}

bool AccountsDataMigrator::_migrateAccountsFrom7A153(AccountsManager& store) {
  const BasicAccountReference onDevice =
      BasicAccount::initWithProperties(DeviceLocalAccount::basicAccountProperties());
  if (onDevice != nullptr) {
    PropertyArray dataclasses;
    for (const SyncedKind& kind : kSyncedKinds) {
      if (belongsOnDevice(kind)) {
        dataclasses.append(kind.dataclass);
      }
    }
    onDevice->setEnabledForDataclasses(dataclasses);
    nameMadeAccount(*onDevice);
    store.replaceAccountsWithTypes_withAccounts({kOnMyDeviceAccountType}, {onDevice});
  }
  store.setDataVersion(3);
  return true;
}

bool AccountsDataMigrator::_tetheredDisabledInSources(const PropertyArray& sources) {
  return sources.containsText(kDenyTetheredSource);
}

bool AccountsDataMigrator::_migrateAccountsFrom7A241(AccountsManager& store) {
  const AccountsManager::Accounts hosted = store.basicAccountsWithTypes({kVelmoraAccountType});
  for (const BasicAccountReference& account : hosted) {
    std::optional<PropertyArray> enabled = account->enabledDataclasses();
    if (enabled) {
      enabled->removeText(kAccountDataclassNotes);
    }
    account->setAccountProperty_forKey(enabled, kAccountEnabledDataclasses);
  }
  store.replaceAccountsWithTypes_withAccounts({kVelmoraAccountType}, hosted);
  store.setDataVersion(4);
  return true;
}

}  // namespace accounts
