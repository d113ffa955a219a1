#include <algorithm>

#include "accountsettings/Log.h"
#include "accountsettings/Process.h"
#include "migrator/AccountsDataMigrator.h"
#include "migrator/HasClass.h"
#include "vocabulary/DeviceServices.h"

namespace accounts {

namespace {

/// The states of a cloud account, under the key that the cloud account service supplies.
enum class CloudStatus : std::int64_t {
  Normal = 1,
  /// The account still stands for the hosted service.
  StandsForHostedService = 2
};

CloudAccountService& cloudAccountService() {
  return Process::current().platform.cloudAccountService;
}

bool hasStatus(const BasicAccount& account, CloudStatus status) {
  return account.integerPropertyForKey(cloudAccountService().statusKey()) ==
         static_cast<std::int64_t>(status);
}

void setStatus(BasicAccount& account, CloudStatus status) {
  account.setAccountProperty_forKey(static_cast<std::int64_t>(status),
                                    cloudAccountService().statusKey());
}

bool isPrimary(const BasicAccount& account) {
  return account.booleanPropertyForKey(kPrimaryAccountKey).value_or(false);
}

void enableUbiquityAndKeyValue(BasicAccount& account, bool enabled) {
  account.setEnabled_forDataclass(enabled, kAccountDataclassUbiquity);
  account.setEnabled_forDataclass(enabled, kAccountDataclassKeyValue);
}

void makePrimary(BasicAccount& account) {
  account.setAccountProperty_forKey(true, cloudAccountService().primaryAccountKey());
  enableUbiquityAndKeyValue(account, true);
}

void addReminders(BasicAccount& account) {
  if (account.supportedDataclasses().containsText(kAccountDataclassReminders) &&
      account.isEnabledForDataclass(kAccountDataclassCalendars)) {
    account.setEnabled_forDataclass(true, kAccountDataclassReminders);
  }
}

/// Brings a cloud account that stands for the hosted service into shape. True when it was made the
/// primary account.
bool settleHostedServiceStatus(BasicAccount& account) {
  logToConsole("Found Velmora account with status 2");
  const std::optional<PropertyArray> children = account.arrayPropertyForKey(kAccountChildAccounts);
  if (children && !children->empty()) {
    setStatus(account, CloudStatus::Normal);
    logToConsole("Standard Velmora account with status 2, reverting to status 1");
    return false;
  }

  const std::string typeName = cloudAccountService().accountTypeDisplayName();
  // The hosted service's default display name is the same text as its account type.
  if (account.displayName() == kVelmoraAccountType) {
    account.setDisplayName(typeName);
  }
  const bool locatesDevice = account.isEnabledForDataclass(kAccountDataclassDeviceLocator);
  if (locatesDevice) {
    makePrimary(account);
  }
  account.setAccountProperty_forKey(typeName, kAccountTypeString);
  account.setAccountProperty_forKey(typeName, kAccountShortTypeString);
  return locatesDevice;
}

/// Stores an account's effective provisioned dataclasses with one more.
void provision(BasicAccount& account, PropertyArray provisioned, std::string_view dataclass) {
  provisioned.append(dataclass);
  account.setAccountProperty_forKey(std::move(provisioned), kAccountProvisionedDataclasses);
}

/// Lets the wallet dataclass of a primary account follow its cloud documents.
void addShoebox(BasicAccount& account) {
  const PropertyArray provisioned = account.provisionedDataclasses();
  if (!provisioned.containsText(kAccountDataclassUbiquity)) {
    return;
  }
  if (!provisioned.containsText(kAccountDataclassShoebox)) {
    logToConsole("AccountsDataMigrator: Provisioning Shoebox data class in primary account");
    provision(account, provisioned, kAccountDataclassShoebox);
  }
  if (account.isEnabledForDataclass(kAccountDataclassUbiquity)) {
    // Kept on purpose: the line tells what is tried; it is written also when the account's type
    // does not support the dataclass and the switch has no effect.
    logToConsole("AccountsDataMigrator: Enabling Shoebox data class in primary account");
    account.setEnabled_forDataclass(true, kAccountDataclassShoebox);
  }
}

/// Keeps cloud documents and key-value storage to the primary account.
void fixSecondaryAccount(BasicAccount& account) {
  if (!isPrimary(account) && (account.isEnabledForDataclass(kAccountDataclassUbiquity) ||
                              account.isEnabledForDataclass(kAccountDataclassKeyValue))) {
    logToConsole(
        "AccountsDataMigrator: Fixing secondary account with ubiquity and keyvalue enabled");
    enableUbiquityAndKeyValue(account, false);
  }
}

}  // namespace

bool AccountsDataMigrator::_account_hasChildAccountOfType(const BasicAccount& account,
                                                          std::string_view type) {
  const std::optional<PropertyArray> children = account.arrayPropertyForKey(kAccountChildAccounts);
  return children && std::ranges::any_of(*children, [&](const PropertyValue& child) {
           const PropertyDictionary* const dictionary = child.asDictionary();
           return dictionary != nullptr && dictionary->textForKey(kAccountType) == type;
         });
}

void AccountsDataMigrator::_enableProvisioningForDataClass_toAccount_ifChildAccountExistsOfType(
    std::string_view dataclass, BasicAccount& account, std::string_view type) {
  if (!_account_hasChildAccountOfType(account, type)) {
    return;
  }
  const PropertyArray provisioned = account.provisionedDataclasses();
  if (!provisioned.containsText(dataclass)) {
    logToConsole("AccountsDataMigrator: Enabling provisioning for dataclass %@", {dataclass});
    provision(account, provisioned, dataclass);
  }
}

bool AccountsDataMigrator::_migrateAccountsFrom9A182(AccountsManager& store) {
  bool primaryFound = false;
  for (const BasicAccountReference& account : store.allBasicSyncableAccounts()) {
    addReminders(*account);
    if (!hasClass(*account, kCloudAccountClass)) {
      continue;
    }
    if (hasStatus(*account, CloudStatus::StandsForHostedService)) {
      primaryFound = settleHostedServiceStatus(*account) || primaryFound;
    } else {
      account->setEnabled_forDataclass(false, kAccountDataclassReminders);
    }
  }

  if (!primaryFound) {
    const AccountsManager::Accounts cloudAccounts =
        store.basicAccountsWithTypes({kQuarxAccountType});
    const auto first = std::ranges::find_if(cloudAccounts, [](const auto& account) {
      return hasStatus(*account, CloudStatus::StandsForHostedService);
    });
    if (first != cloudAccounts.end()) {
      makePrimary(**first);
    }
  }
  store.setDataVersion(10);
  store.saveAllAccounts();
  return true;
}

bool AccountsDataMigrator::_migrateAccountsFrom9A334(AccountsManager& store) {
  for (const BasicAccountReference& account :
       store.basicAccountsWithTypes({kQuarxAccountType, kVelmoraAccountType})) {
    fixSecondaryAccount(*account);
    if (!hasClass(*account, kCloudAccountClass)) {
      continue;
    }
    if (hasStatus(*account, CloudStatus::StandsForHostedService) &&
        _account_hasChildAccountOfType(*account, kVelmoraAccountType)) {
      logToConsole(
          "AccountsDataMigrator: Found Velmora mail as Stratix child account, setting status to 1");
      setStatus(*account, CloudStatus::Normal);
    }
    _enableProvisioningForDataClass_toAccount_ifChildAccountExistsOfType(
        kAccountDataclassMail, *account, kVelmoraAccountType);
    _enableProvisioningForDataClass_toAccount_ifChildAccountExistsOfType(
        kAccountDataclassCalendars, *account, kCalDAVAccountType);
  }
  store.setDataVersion(11);
  store.saveAllAccounts();
  return true;
}

bool AccountsDataMigrator::_migrateAccountsFrom9B176(AccountsManager& store) {
  for (const BasicAccountReference& account :
       store.basicAccountsWithTypes({kQuarxAccountType, kVelmoraAccountType})) {
    if (isPrimary(*account)) {
      addShoebox(*account);
    }
    // Kept on purpose: once for each such account, not once in all.
    if (account->isEnabledForDataclass(kAccountDataclassBookmarks)) {
      Process::current().platform.cloudTabService.announce(CloudTabs::On);
    }
  }
  store.setDataVersion(12);
  store.saveAllAccounts();
  return true;
}

}  // namespace accounts
