#include <algorithm>
#include <array>

#include "accountsettings/ASRuntimeFixMailAccount.h"
#include "accountsettings/Log.h"
#include "accountsettings/Process.h"
#include "migrator/AccountsDataMigrator.h"
#include "migrator/HasClass.h"
#include "migrator/LegacyDescriptions.h"
#include "vocabulary/LegacyStoreKeys.h"

bool _UseGoogleMail() {
  accounts::Process& process = accounts::Process::current();
  return process.usesGoogleMail.get([&process] {
    const std::optional<accounts::PropertyValue> answer =
        process.platform.deviceInfoService.copyAnswer("RegionalBehaviorGoogleMail");
    return answer && answer->booleanValue().value_or(false);
  });
}

namespace accounts {

namespace {

constexpr std::string_view kMailConversionOperation =
    "-[AccountsDataMigrator(Internal) _migrateMailAccounts:]";

const std::array<LegacyKey, 3> kMailKeys = {{
    {kLegacyMailClass, kAccountClass},
    {kLegacyMailDisplayName, kAccountDisplayName},
    {kLegacyMailIdentifier, kAccountIdentifier},
}};

/// What a legacy mail account class stands for.
struct MailAccountKind {
  std::string_view accountClass;
  std::string_view type;
  std::string_view typeString;
};

const std::array<MailAccountKind, 8> kMailAccountKinds = {{
    {kGmailAccountClass, kGmailAccountType, "Gmail"},
    {kMarrowAccountClass, kVelmoraAccountType, "Velmora"},
    {kVelmoraAccountClass, kVelmoraAccountType, "Velmora"},
    {kTolvaneIMAPAccountClass, kTolvaneIMAPAccountType, "Stratix"},
    // The service's name ends with the left-to-right mark U+200E.
    {kYahooAccountClass, kYahooAccountType, "Yahoo!\xE2\x80\x8E"},
    {kDataAccessMailAccountClass, kExchangeAccountType, "Exchange ActiveSync"},
    {kDeliveryAccountClass, kSMTPAccountType, "Account"},
    {kSMTPAccountClass, kSMTPAccountType, "Account"},
}};
const MailAccountKind kAnyOtherMailAccountKind = {{}, kMailAccountType, "Account"};
constexpr std::string_view kGmailTypeStringInGoogleMailRegions = "Google Mail";

const MailAccountKind& kindOfMailAccountClass(std::string_view accountClass) {
  const auto* const kind =
      std::ranges::find(kMailAccountKinds, accountClass, &MailAccountKind::accountClass);
  return kind != kMailAccountKinds.end() ? *kind : kAnyOtherMailAccountKind;
}

/// The hosted service's accounts are stored by the bare user name.
void cutUsernameBeforeDomain(PropertyDictionary& properties) {
  const std::optional<Text> username = properties.textForKey(kAccountUsername);
  if (username) {
    properties.set(kAccountUsername, username->view().substr(0, username->view().find('@')));
  }
}

}  // namespace

PropertyDictionary accountPropertiesOfMailDescription(const PropertyDictionary& description,
                                                      std::string_view type) {
  PropertyDictionary properties = description;
  moveLegacyKeys(properties, kMailKeys);
  properties.set(kAccountType, type);

  std::optional<Text> accountClass = properties.textForKey(kAccountClass);
  if (!accountClass && type == kSMTPAccountType) {
    accountClass = kSMTPAccountClass;
    properties.set(kAccountClass, *accountClass);
  }
  if (accountClass) {
    using Migrator = AccountsDataMigrator;
    properties.set(kAccountTypeString,
                   Migrator::_accountTypeStringForMailAccountClass(*accountClass));
    properties.set(kAccountShortTypeString,
                   Migrator::_accountShortTypeStringForMailAccountClass(*accountClass));
    properties.set(kAccountType, Migrator::_accountTypeForMailAccountClass(*accountClass));
  }
  if (properties.textForKey(kAccountType) == kVelmoraAccountType) {
    cutUsernameBeforeDomain(properties);
  }
  return properties;
}

bool AccountsDataMigrator::_migrateMailAccounts(AccountsManager& store) {
  const std::string path = mailAccountsPath();
  const std::optional<PropertyDictionary> file =
      Process::current().platform.propertyLists.readDictionary(path);
  const PropertyDictionary legacyAccounts = file.value_or(PropertyDictionary());
  if (!legacyAccounts.empty()) {
    _foundOldMailAccountsToMigrate = true;
  }
  collect(kInformationOldMailAccounts, file);

  const bool converted = replaceMailAccounts(store, legacyAccounts);
  removeOriginalBeside(path);
  return converted;
}

bool AccountsDataMigrator::replaceMailAccounts(AccountsManager& store,
                                               const PropertyDictionary& legacyAccounts) {
  const PropertyArray outgoingDescriptions =
      legacyAccounts.arrayForKey(kLegacyOutgoingAccounts).value_or(PropertyArray());
  const PropertyArray incomingDescriptions =
      legacyAccounts.arrayForKey(kLegacyIncomingAccounts).value_or(PropertyArray());
  const auto converted = [&](AccountOrigin::Kind array, const PropertyArray& descriptions,
                             std::string_view type, std::string_view failureLine) {
    return convertDescriptions(array, descriptions, kMailConversionOperation, failureLine,
                               [&](const PropertyDictionary& description) {
                                 return _convertMailAccountDescription_type(description, type);
                               });
  };
  const std::optional<AccountsManager::Accounts> outgoing =
      converted(AccountOrigin::Kind::OutgoingMail, outgoingDescriptions, kSMTPAccountType,
                "%s. Could not convert the description for the delivery account %@");
  if (!outgoing) {
    tellOutWithItsStore(AccountOrigin::Kind::IncomingMail, incomingDescriptions.size(), {});
    return false;
  }
  const std::optional<AccountsManager::Accounts> incoming =
      converted(AccountOrigin::Kind::IncomingMail, incomingDescriptions, kMailAccountType,
                "%s. Could not convert the description for the incoming account %@");
  if (!incoming) {
    tellOutWithItsStore(AccountOrigin::Kind::OutgoingMail, outgoingDescriptions.size(), {});
    return false;
  }
  store.replaceAccountsWithTypes_withAccounts({kSMTPAccountType}, *outgoing);
  // Kept on purpose: the incoming records are of several types by now, yet only accounts of type
  // "Mail" give way to them: accounts of the other types that the file holds are another store's.
  store.replaceAccountsWithTypes_withAccounts({kMailAccountType}, *incoming);
  return true;
}

BasicAccountReference AccountsDataMigrator::_convertMailAccountDescription_type(
    const PropertyDictionary& description, std::string_view type) {
  const PropertyDictionary properties = accountPropertiesOfMailDescription(description, type);
  BasicAccountReference record = BasicAccount::initWithProperties(properties);
  if (record == nullptr) {
    return nullptr;
  }
  std::optional<Text> syncIdentifier = properties.textForKey(kAccountIdentifier);
  if (!syncIdentifier) {
    syncIdentifier = BasicAccount::createNewAccountUID();
  }
  if (syncIdentifier) {
    record->setAccountProperty_forKey(*syncIdentifier, kAccountSyncIdentifier);
  }
  if (record->accountClass() == kGenericMailAccountClass) {
    reportMailAccountClassFound();
  }
  return record;
}

std::string_view AccountsDataMigrator::_accountTypeForMailAccountClass(
    std::string_view accountClass) {
  return kindOfMailAccountClass(accountClass).type;
}

std::string_view AccountsDataMigrator::_accountTypeStringForMailAccountClass(
    std::string_view accountClass) {
  return _accountShortTypeStringForMailAccountClass(accountClass);
}

std::string_view AccountsDataMigrator::_accountShortTypeStringForMailAccountClass(
    std::string_view accountClass) {
  if (accountClass == kGmailAccountClass && _UseGoogleMail()) {
    return kGmailTypeStringInGoogleMailRegions;
  }
  return kindOfMailAccountClass(accountClass).typeString;
}

}  // namespace accounts
