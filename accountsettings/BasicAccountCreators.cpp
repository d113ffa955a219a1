#include "accountsettings/AccountCreators.h"
#include "accountsettings/BasicAccount.h"
#include "accountsettings/Log.h"
#include "accountsettings/Process.h"

namespace accounts {

namespace {

constexpr std::string_view kFullAccountCreator = "FullAccount";
constexpr std::string_view kSyncAccountCreator = "SyncAccount";

constexpr std::string_view kCreatorClassNameOperation =
    "-[BasicAccount _creatorClassNameForAccountType:creatorType:loader:]";
constexpr std::string_view kFullAccountOperation = "-[BasicAccount fullAccountUsingLoader:]";
constexpr std::string_view kSyncAccountOperation = "-[BasicAccount(Internal) _cachedSyncAccount]";

/// What the credentials handler is told: its meaning is the caller's framework's.
constexpr int kCredentialsNotRenewed = 3;

}  // namespace

std::optional<PropertyDictionary> BasicAccount::_creatorsInfo() {
  return Process::current().platform.bundleResources.readPropertyList("AccountCreators");
}

const std::optional<PropertyDictionary>& BasicAccount::_accountCreationMap() {
  return Process::current().accountCreationMap.get(_creatorsInfo);
}

std::optional<Text> BasicAccount::_creatorClassNameForAccountType_creatorType_loader(
    const std::optional<Text>& type, std::string_view creatorType,
    FullAccountLoader* loader) const {
  std::optional<Text> className;
  // Kept on purpose: the walk goes on after a match, so that every framework of the kind is loaded
  // and the last class named is the one used.
  for (const PropertyValue& element :
       creatorEntriesForType(type, kCreatorClassNameOperation, kAccountSourceFile)) {
    const PropertyDictionary* creator = element.asDictionary();
    if (creator == nullptr || creator->textForKey(kCreatorTypeKey) != creatorType) {
      continue;
    }
    const std::optional<PropertyDictionary> description =
        creator->dictionaryForKey(kCreatorDescriptionKey);
    if (!description) {
      failAssertion(kCreatorClassNameOperation, kAccountSourceFile,
                    "Malformed AccountCreators information. Could not find the description for the "
                    "%@ with type %@",
                    {creatorType, type});
    }
    const bool loaderHasLoaded = loader != nullptr && creatorType == kFullAccountCreator &&
                                 loader->loadBundleForAccountWithProperties(properties());
    if (!loaderHasLoaded) {
      const std::optional<Text> framework = description->textForKey(kCreatorFrameworkKey);
      if (!framework) {
        failAssertion(kCreatorClassNameOperation, kAccountSourceFile,
                      "Malformed AccountCreators information. Could not find the path to the "
                      "framework for the %@ with type %@",
                      {creatorType, type});
      }
      loadCreatorFramework(*framework, kCreatorClassNameOperation, kAccountSourceFile);
    }
    className = description->textForKey(kCreatorClassKey);
    if (!className || className->empty()) {
      failAssertion(kCreatorClassNameOperation, kAccountSourceFile,
                    "Malformed AccountCreators information. Could not find the name of the class "
                    "that creates %@ with the type %@",
                    {creatorType, type});
    }
  }
  return className;
}

std::optional<Text> BasicAccount::fullAccountCreatorClassNameForAccountType_loader(
    const std::optional<Text>& type, FullAccountLoader* loader) const {
  return _creatorClassNameForAccountType_creatorType_loader(type, kFullAccountCreator, loader);
}

std::optional<Text> BasicAccount::syncAccountCreatorClassNameForAccountType(
    const std::optional<Text>& type) const {
  return _creatorClassNameForAccountType_creatorType_loader(type, kSyncAccountCreator, nullptr);
}

FullAccountReference BasicAccount::fullAccountUsingLoader(FullAccountLoader* loader) {
  if (_fullAccount != nullptr) {
    return _fullAccount;
  }
  const std::optional<Text> accountType = type();
  const std::optional<Text> className =
      fullAccountCreatorClassNameForAccountType_loader(accountType, loader);
  const AccountClass* creator = className ? creatorClassNamed(*className) : nullptr;
  if (creator == nullptr) {
    failAssertion(kFullAccountOperation, kAccountSourceFile,
                  "The framework/bundle where %@ is defined has not been loaded", {className});
  }
  const FullAccountReference account =
      answerOf(className, kFullAccountOperation, kAccountSourceFile, [&] {
        FullAccountReference made;
        if (creator->classForAccountType) {
          const AccountClass* accountClass = creator->classForAccountType(*accountType);
          if (accountClass != nullptr && accountClass->initWithProperties) {
            made = accountClass->initWithProperties(properties());
          }
        } else if (creator->accountWithBasicAccount) {
          made = creator->accountWithBasicAccount(shared_from_this());
        }
        if (made != nullptr) {
          made->setParentAccount(_parentAccount);
        }
        return made;
      });
  if (account == nullptr) {
    failAssertion(kFullAccountOperation, kAccountSourceFile,
                  "Could not create the account with class %@ and id %@",
                  {className, identifier()});
  }
  setFullAccount(account);
  return _fullAccount;
}

void BasicAccount::setFullAccount(FullAccountReference account) {
  _fullAccount = std::move(account);
}

SyncAccountReference BasicAccount::_cachedSyncAccount() {
  if (_syncAccount != nullptr) {
    return _syncAccount;
  }
  const std::optional<Text> className = syncAccountCreatorClassNameForAccountType(type());
  if (!className) {
    return nullptr;
  }
  const AccountClass* creator = creatorClassNamed(*className);
  if (creator == nullptr) {
    logToChannel(kSyncAccountOperation,
                 "ERROR: The framework/bundle where %@ is defined has not been loaded, so there is "
                 "no syncable account for basic account with properties %@",
                 [&] { return logArguments(className, properties()); });
    return nullptr;
  }
  // A failed attempt is not remembered: the next call tries again.
  if (creator->accountToRefreshForBasicAccount) {
    _syncAccount = answerOf(className, kSyncAccountOperation, kAccountSourceFile, [&] {
      return creator->accountToRefreshForBasicAccount(shared_from_this());
    });
  }
  if (_syncAccount == nullptr) {
    logToChannel(kSyncAccountOperation,
                 "ERROR: Could not create the account with class %@ and id %@",
                 [&] { return logArguments(className, identifier()); });
  }
  return _syncAccount;
}

namespace {

/// What the sync account of a record answers to a refresh; none without one.
template <class Call>
std::optional<PropertyValue> refreshed(BasicAccount& record, std::string_view operation,
                                       const Call& call) {
  const SyncAccountReference account = record._cachedSyncAccount();
  if (account == nullptr) {
    return std::nullopt;
  }
  try {
    return call(*account);
  } catch (...) {
    failOnException(record.syncAccountCreatorClassNameForAccountType(record.type()), operation,
                    kAccountSourceFile);
  }
}

}  // namespace

std::optional<PropertyValue>
BasicAccount::refreshContainerWithIdentifier_forDataclass_isUserRequested(
    std::string_view identifier, std::string_view dataclass, bool isUserRequested) {
  return refreshed(*this,
                   "-[BasicAccount refreshContainerWithIdentifier:forDataclass:isUserRequested:]",
                   [&](SyncAccount& account) {
                     return account.refreshContainerWithIdentifier_forDataclass_isUserRequested(
                         identifier, dataclass, isUserRequested);
                   });
}

std::optional<PropertyValue> BasicAccount::refreshContainerListForDataclass_isUserRequested(
    std::string_view dataclass, bool isUserRequested) {
  return refreshed(*this, "-[BasicAccount refreshContainerListForDataclass:isUserRequested:]",
                   [&](SyncAccount& account) {
                     return account.refreshContainerListForDataclass_isUserRequested(
                         dataclass, isUserRequested);
                   });
}

std::optional<PropertyValue> BasicAccount::refreshContainersForDataclass_isUserRequested(
    std::string_view dataclass, bool isUserRequested) {
  return refreshed(*this, "-[BasicAccount refreshContainersForDataclass:isUserRequested:]",
                   [&](SyncAccount& account) {
                     return account.refreshContainersForDataclass_isUserRequested(dataclass,
                                                                                  isUserRequested);
                   });
}

std::optional<PropertyValue> BasicAccount::refreshContainerWithIdentifier_forDataclass(
    std::string_view identifier, std::string_view dataclass) {
  return refreshContainerWithIdentifier_forDataclass_isUserRequested(identifier, dataclass, false);
}

std::optional<PropertyValue> BasicAccount::refreshContainerListForDataclass(
    std::string_view dataclass) {
  return refreshContainerListForDataclass_isUserRequested(dataclass, false);
}

std::optional<PropertyValue> BasicAccount::refreshContainersForDataclass(
    std::string_view dataclass) {
  return refreshContainersForDataclass_isUserRequested(dataclass, false);
}

void BasicAccount::renewAccountCredentialsWithHandler(
    const std::function<void(int resultCode)>& handler) {
  handler(kCredentialsNotRenewed);
}

}  // namespace accounts
