#include "tests/accountsettings/CreatorsFixture.h"

namespace accounts {
namespace {

/// A sync account that gives back what it was asked.
struct EchoingSyncAccount : SyncAccount {
  std::optional<PropertyValue> refreshContainerWithIdentifier_forDataclass_isUserRequested(
      std::string_view identifier, std::string_view dataclass, bool isUserRequested) override {
    return PropertyArray{"container", identifier, dataclass, isUserRequested};
  }
  std::optional<PropertyValue> refreshContainerListForDataclass_isUserRequested(
      std::string_view dataclass, bool isUserRequested) override {
    return PropertyArray{"list", dataclass, isUserRequested};
  }
  std::optional<PropertyValue> refreshContainersForDataclass_isUserRequested(
      std::string_view dataclass, bool isUserRequested) override {
    return PropertyArray{"containers", dataclass, isUserRequested};
  }
};

class SyncAccountTest : public CreatorsTest {
 protected:
  SyncAccountTest() {
    setCreators({{"Mail", PropertyArray{syncAccountCreator("Mail.so", "MailSync")}},
                 {"LDAP", PropertyArray{fullAccountCreator("Mail.so", "LDAPFull")}}});
  }

  /// Makes the class known; each request of it is recorded, and the first `failures` of them give
  /// none.
  void registerSyncClass(int failures = 0) {
    AccountClass accountClass;
    accountClass.accountToRefreshForBasicAccount =
        [this, failures](const AccountRecordReference& record) -> SyncAccountReference {
      requests_.push_back(record);
      return static_cast<int>(requests_.size()) > failures ? std::make_shared<EchoingSyncAccount>()
                                                           : nullptr;
    };
    frameworkLoader.registerClass("MailSync", accountClass);
  }

  std::vector<AccountRecordReference> requests_;
  BasicAccountReference record_ = account("A", kMailAccountType);
};

TEST_F(SyncAccountTest, IsMadeFromTheRecordOnceAndKept) {
  registerSyncClass();

  const SyncAccountReference first = record_->_cachedSyncAccount();
  const SyncAccountReference second = record_->_cachedSyncAccount();

  EXPECT_NE(first, nullptr);
  EXPECT_EQ(first, second);
  EXPECT_EQ(requests_, std::vector<AccountRecordReference>{record_});
}

TEST_F(SyncAccountTest, RefreshesAreForwardedWithTheirArgumentsAndTheirResults) {
  registerSyncClass();

  EXPECT_EQ(
      record_->refreshContainerWithIdentifier_forDataclass_isUserRequested("inbox", "D", true),
      PropertyValue(PropertyArray{"container", "inbox", "D", true}));
  EXPECT_EQ(record_->refreshContainerListForDataclass_isUserRequested("D", true),
            PropertyValue(PropertyArray{"list", "D", true}));
  EXPECT_EQ(record_->refreshContainersForDataclass_isUserRequested("D", true),
            PropertyValue(PropertyArray{"containers", "D", true}));
}

TEST_F(SyncAccountTest, RefreshesWithoutTheFlagAreNotTheUsers) {
  registerSyncClass();

  EXPECT_EQ(record_->refreshContainerWithIdentifier_forDataclass("inbox", "D"),
            PropertyValue(PropertyArray{"container", "inbox", "D", false}));
  EXPECT_EQ(record_->refreshContainerListForDataclass("D"),
            PropertyValue(PropertyArray{"list", "D", false}));
  EXPECT_EQ(record_->refreshContainersForDataclass("D"),
            PropertyValue(PropertyArray{"containers", "D", false}));
}

TEST_F(SyncAccountTest, ATypeWithoutSyncCreatorHasNoneWithoutAMessage) {
  const BasicAccountReference directory = account("L", kLDAPAccountType);

  EXPECT_EQ(directory->syncAccountCreatorClassNameForAccountType(kLDAPAccountType), std::nullopt);
  EXPECT_EQ(directory->_cachedSyncAccount(), nullptr);
  EXPECT_EQ(directory->refreshContainersForDataclass("D"), std::nullopt);
  EXPECT_TRUE(logSystem.channel.lines.empty());
}

TEST_F(SyncAccountTest, AClassThatCannotBeFoundIsLoggedAndRefreshesDoNothing) {
  EXPECT_EQ(record_->refreshContainersForDataclass("D"), std::nullopt);

  EXPECT_EQ(logSystem.channel.linesWithoutNumbers(),
            std::vector<std::string>{
                R"(-[BasicAccount(Internal) _cachedSyncAccount] (N) "ERROR: The framework/bundle )"
                R"(where MailSync is defined has not been loaded, so there is no syncable account )"
                R"(for basic account with properties {"Class":"IMAPAccount","Identifier":"A",)"
                R"("Type":"Mail"}")"});
}

TEST_F(SyncAccountTest, AFailedAttemptIsLoggedAndMadeAgainTheNextTime) {
  registerSyncClass(1);

  EXPECT_EQ(record_->_cachedSyncAccount(), nullptr);
  EXPECT_EQ(logSystem.channel.linesWithoutNumbers(),
            std::vector<std::string>{R"(-[BasicAccount(Internal) _cachedSyncAccount] (N) "ERROR: )"
                                     R"(Could not create the account with class MailSync and id )"
                                     R"(A")"});
  EXPECT_NE(record_->_cachedSyncAccount(), nullptr);
  EXPECT_EQ(requests_.size(), 2U);
}

TEST_F(SyncAccountTest, TheLookupNeverAsksALoader) {
  RecordingLoader loader;

  EXPECT_EQ(
      record_->_creatorClassNameForAccountType_creatorType_loader("Mail", "SyncAccount", &loader),
      "MailSync");
  EXPECT_TRUE(loader.asked.empty());
  EXPECT_EQ(frameworkLoader.loads, std::vector<std::string>{"/Mail.so"});
}

TEST_F(SyncAccountTest, AClassThatMakesNoSyncAccountsGivesNone) {
  frameworkLoader.registerClass("MailSync", AccountClass());

  EXPECT_EQ(record_->_cachedSyncAccount(), nullptr);
}

TEST_F(SyncAccountTest, WithoutASyncAccountNoRefreshHasAResult) {
  frameworkLoader.registerClass("MailSync", AccountClass());

  EXPECT_EQ(record_->refreshContainerWithIdentifier_forDataclass("c", kAccountDataclassMail),
            std::nullopt);
  EXPECT_EQ(record_->refreshContainerListForDataclass(kAccountDataclassMail), std::nullopt);
  EXPECT_EQ(record_->refreshContainersForDataclass(kAccountDataclassMail), std::nullopt);
}

}  // namespace
}  // namespace accounts
