#pragma once

#include <gmock/gmock.h>
#include <gtest/gtest.h>

#include <memory>
#include <string>
#include <vector>

#include "accountsettings/AccountsManager.h"
#include "accountsettings/DeviceLocalAccount.h"
#include "tests/fakes/FakePlatform.h"

namespace accounts {

/// A full account that remembers what it was given.
struct RecordedFullAccount : FullAccount {
  PropertyDictionary properties;
  // Weak, because the record owns this object.
  std::weak_ptr<AccountRecord> record;
  AccountRecordReference parent;
  int parentCalls = 0;

  void setParentAccount(AccountRecordReference newParent) override {
    parent = std::move(newParent);
    ++parentCalls;
  }
};

/// One entry of the account-creation map.
inline PropertyDictionary creatorEntry(std::string_view kind, PropertyDictionary description) {
  return {{"Type", kind}, {"Description", std::move(description)}};
}

inline PropertyDictionary fullAccountCreator(std::string_view framework,
                                             std::string_view accountClass) {
  return creatorEntry("FullAccount", {{"Framework", framework}, {"Class", accountClass}});
}

inline PropertyDictionary syncAccountCreator(std::string_view framework,
                                             std::string_view accountClass) {
  return creatorEntry("SyncAccount", {{"Framework", framework}, {"Class", accountClass}});
}

inline PropertyDictionary notifierCreator(std::string_view framework, std::string_view accountClass,
                                          PropertyArray dataclasses) {
  return creatorEntry("NotifierAccount", {{"Framework", framework},
                                          {"Class", accountClass},
                                          {"Supported Dataclasses", std::move(dataclasses)}});
}

/// A class of the second kind, whose accounts remember the record that they were made from.
inline AccountClass classMakingAccountsFromRecords() {
  AccountClass accountClass;
  accountClass.accountWithBasicAccount = [](const AccountRecordReference& record) {
    auto account = std::make_shared<RecordedFullAccount>();
    account->record = record;
    return account;
  };
  return accountClass;
}

inline BasicAccountReference account(std::string_view identifier, std::string_view type,
                                     PropertyDictionary more = {}) {
  more.set(kAccountIdentifier, identifier);
  more.set(kAccountType, type);
  more.set(kAccountClass, "IMAPAccount");
  return BasicAccount::initWithProperties(more);
}

/// A caller's loader that remembers what it was asked.
struct RecordingLoader : FullAccountLoader {
  bool hasLoaded = true;
  std::vector<PropertyDictionary> asked;

  bool loadBundleForAccountWithProperties(const PropertyDictionary& properties) override {
    asked.push_back(properties);
    return hasLoaded;
  }
};

/// A device whose account-creation map a test gives.
class CreatorsTest : public testing::Test, protected FakeProcess {
 protected:
  void setCreators(PropertyDictionary map) {
    bundleResources.replaced["AccountCreators"] = std::move(map);
  }
};

}  // namespace accounts
