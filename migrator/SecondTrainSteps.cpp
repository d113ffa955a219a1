#include <array>

#include "accountsettings/MailServices.h"
#include "accountsettings/Process.h"
#include "migrator/AccountsDataMigrator.h"
#include "migrator/HasClass.h"
#include "migrator/MigrationStage.h"
#include "vocabulary/DeviceServices.h"

namespace accounts {

namespace {

constexpr std::array kHostedServiceClasses = {kVelmoraAccountClass, kMarrowAccountClass};
constexpr std::array kMailOnlyClasses = {kIMAPAccountClass, kGmailAccountClass, kYahooAccountClass,
                                         kAOLAccountClass, kPOPAccountClass};

constexpr std::string_view kCalDAVEnabledKey = "CalDAVEnabled";

/// What a parent account copies from the hosted-service account, and what it takes away from it.
const std::array<std::string_view, 2> kCopiedKeys = {kAccountDisplayName, kCalDAVEnabledKey};
const std::array<std::string_view, 4> kMovedKeys = {
    kAccountEnabledDataclasses, kAccountChildAccounts, kCalendarsAccountSubscribedCalendars,
    kExoSubscribedCalendarsKey};

bool isHostedServiceAccount(const BasicAccount& account) {
  return hasClassAmong(account, kHostedServiceClasses);
}

/// The full address of a user of the hosted service. The mail conversion stores bare user names.
std::string hostedServiceAddress(std::string_view username, std::string_view accountClass) {
  std::string address(username);
  if (username.find('@') == std::string_view::npos) {
    const MailServices& services = MailServices::current();
    address += '@';
    address += accountClass == kMarrowAccountClass ? services.earliestHostedDomain
                                                   : services.laterHostedDomain;
  }
  return address;
}

void copyProperty(const BasicAccount& account, std::string_view key, PropertyDictionary& target) {
  if (std::optional<PropertyValue> value = account.accountPropertyForKey(key)) {
    target.set(key, *std::move(value));
  }
}

/// The account dictionary of the parent that a hosted-service account gets.
PropertyDictionary parentProperties(const BasicAccount& hosted) {
  using Migrator = AccountsDataMigrator;
  const Text accountClass = hosted.accountClass().value_or(Text());
  PropertyDictionary properties = {
      {kAccountType, kQuarxAccountType},
      {kAccountClass, accountClass},
      {kAccountTypeString, Migrator::_accountTypeStringForMailAccountClass(accountClass)},
      {kAccountShortTypeString, Migrator::_accountShortTypeStringForMailAccountClass(accountClass)},
      {kAccountProvisionedDataclasses, hosted.supportedDataclasses()},
  };
  if (const std::optional<Text> username = hosted.textPropertyForKey(kAccountUsername)) {
    properties.set(kAccountUsername, hostedServiceAddress(*username, accountClass));
  }
  for (const std::string_view key : kCopiedKeys) {
    copyProperty(hosted, key, properties);
  }
  // Own values only: a record that stands in several places of the store is wrapped once for each,
  // and would otherwise take over what its previous parents hold, itself included.
  for (const std::string_view key : kMovedKeys) {
    if (const PropertyValue* value = hosted.properties().find(key)) {
      properties.set(key, *value);
    }
  }
  return properties;
}

/// Puts a parent account in the place of a hosted-service account, which becomes its child.
void wrapHostedServiceAccount(AccountsManager& store, const BasicAccountReference& hosted) {
  const BasicAccountReference parent = BasicAccount::initWithProperties(parentProperties(*hosted));
  if (parent == nullptr) {
    return;
  }
  // Kept on purpose: an account that does not say whether it is active counts as inactive here,
  // while the steps of 7A242 and 8C136 count it as active.
  constexpr bool kActiveIfAbsent = false;
  if (hosted->booleanPropertyForKey(kIsActiveKey).value_or(kActiveIfAbsent)) {
    parent->setEnabled_forDataclass(true, kAccountDataclassMail);
  }
  for (const std::string_view key : kMovedKeys) {
    hosted->removeAccountPropertyForKey(key);
  }
  nameMadeAccount(*parent);
  tellFate({hosted->origin(), ToldFate::MovedBelow, parent->origin()});
  store.replaceAccount_withAccount(hosted, parent);
  hosted->setParentAccount(parent);
  store.addChild_toAccount(hosted, parent);
}

/// Takes the display names off the hosted-service children of a cloud account.
void removeHostedServiceDisplayNames(BasicAccount& cloudAccount) {
  const std::optional<PropertyArray> children =
      cloudAccount.arrayPropertyForKey(kAccountChildAccounts);
  if (!children) {
    return;
  }
  PropertyArray renamed = *children;
  for (std::size_t index = 0; index < children->size(); ++index) {
    const PropertyDictionary* const dictionary = children->at(index).asDictionary();
    const BasicAccountReference child =
        dictionary != nullptr ? BasicAccount::accountWithProperties(*dictionary) : nullptr;
    if (child == nullptr || !isHostedServiceAccount(*child) || !child->displayName()) {
      continue;
    }
    child->removeAccountPropertyForKey(kAccountDisplayName);
    // What is to be replaced is the first element equal to the child's dictionary as it was read.
    // That is always the one at the child's own index: an earlier equal element has itself been
    // replaced by a dictionary without a display name, and no dictionary without one equals a
    // dictionary with one. So no search is needed.
    renamed.replace(index, child->properties());
  }
  cloudAccount.setAccountProperty_forKey(renamed, kAccountChildAccounts);
}

}  // namespace

bool AccountsDataMigrator::_migrateAccountsFrom8A293(AccountsManager& store) {
  const std::optional<PropertyValue> architecture =
      Process::current().platform.deviceInfoService.copyAnswer(kArchitectureQuestion);
  if (architecture == PropertyValue(kArchitectureWithoutMultitasking)) {
    for (const BasicAccountReference& account : store.allBasicAccounts()) {
      // Forced, because on this processor an account's type may not list notes.
      if (account->type() == kOnMyDeviceAccountType) {
        account->_forcedSetEnabled_forDataclass(true, kAccountDataclassNotes);
      } else if (account->isEnabledForDataclass(kAccountDataclassNotes)) {
        account->_forcedSetEnabled_forDataclass(false, kAccountDataclassNotes);
      }
    }
  }
  store.setDataVersion(6);
  return true;
}

// Kept on purpose: this step and the next stamp no version; the store keeps 6 until the step of
// 8F191 stamps 9.
bool AccountsDataMigrator::_migrateAccountsFrom8B117(AccountsManager& store) {
  // A copy, because the store's own list changes with each parent.
  const AccountsManager::Accounts all = store.allBasicAccounts();
  for (const BasicAccountReference& account : all) {
    if (isHostedServiceAccount(*account)) {
      wrapHostedServiceAccount(store, account);
    }
  }
  store.saveAllAccounts();
  return true;
}

bool AccountsDataMigrator::_migrateAccountsFrom8C136(AccountsManager& store) {
  for (const BasicAccountReference& account : store.allBasicAccounts()) {
    if (hasClass(*account, kCloudAccountClass)) {
      removeHostedServiceDisplayNames(*account);
    }
    constexpr bool kActiveIfAbsent = true;
    if (hasClassAmong(*account, kMailOnlyClasses) &&
        account->booleanPropertyForKey(kIsActiveKey).value_or(kActiveIfAbsent)) {
      account->setEnabled_forDataclass(true, kAccountDataclassMail);
    }
  }
  store.saveAllAccounts();
  return true;
}

bool AccountsDataMigrator::_migrateAccountsFrom8F191(AccountsManager& store) {
  store.setDataVersion(9);
  store.saveAllAccounts();
  return true;
}

}  // namespace accounts
