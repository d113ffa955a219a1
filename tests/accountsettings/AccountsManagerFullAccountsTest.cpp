#include "tests/accountsettings/CreatorsFixture.h"

namespace accounts {
namespace {

/// A store whose accounts of every type become full accounts that remember their record.
class FullAccountsOfStoreTest : public CreatorsTest {
 protected:
  FullAccountsOfStoreTest() {
    PropertyDictionary map;
    for (const std::string_view type : {kMailAccountType, kVelmoraAccountType, kGmailAccountType,
                                        kYahooAccountType, kQuarxAccountType, kCalDAVAccountType}) {
      map.set(type, PropertyArray{fullAccountCreator("Any.so", "Creator")});
    }
    map.set(kOnMyDeviceAccountType,
            PropertyArray{fullAccountCreator("Any.so", "DeviceLocalAccount")});
    setCreators(map);
    frameworkLoader.registerClass("Creator", classMakingAccountsFromRecords());
    store_ = AccountsManager::initWithAccounsInfoArray({});
  }

  static std::string identifierOf(const FullAccountReference& account) {
    return dynamic_cast<RecordedFullAccount&>(*account).record.lock()->identifier()->string();
  }

  static std::vector<std::string> identifiersOf(const std::vector<FullAccountReference>& accounts) {
    std::vector<std::string> result;
    for (const FullAccountReference& account : accounts) {
      result.push_back(identifierOf(account));
    }
    return result;
  }

  void insertWithChildren(const BasicAccountReference& parent,
                          const std::vector<BasicAccountReference>& children) {
    store_->insertAccount(parent);
    for (const BasicAccountReference& child : children) {
      store_->addChild_toAccount(child, parent);
    }
  }

  std::unique_ptr<AccountsManager> store_;
};

TEST_F(FullAccountsOfStoreTest, AnIdentifierFindsATopLevelAccount) {
  store_->insertAccount(account("A", kMailAccountType));

  EXPECT_EQ(identifierOf(store_->fullAccountWithIdentifier_loader("A", nullptr)), "A");
}

TEST_F(FullAccountsOfStoreTest, AChildsIdentifierFindsTheChildItself) {
  insertWithChildren(account("P", kQuarxAccountType), {account("C", kMailAccountType)});

  EXPECT_EQ(identifierOf(store_->fullAccountWithIdentifier_loader("C", nullptr)), "C");
}

TEST_F(FullAccountsOfStoreTest, NoIdentifierAnEmptyOneAndAnUnknownOneFindNothing) {
  EXPECT_EQ(store_->fullAccountWithIdentifier_loader(std::nullopt, nullptr), nullptr);
  EXPECT_EQ(store_->fullAccountWithIdentifier_loader("", nullptr), nullptr);
  EXPECT_EQ(store_->fullAccountWithIdentifier_loader("X", nullptr), nullptr);
}

TEST_F(FullAccountsOfStoreTest, AnEmptyIdentifierFindsNotEvenAnAccountThatHasIt) {
  store_->insertAccount(account("", kMailAccountType));

  EXPECT_EQ(store_->fullAccountWithIdentifier_loader("", nullptr), nullptr);
}

TEST_F(FullAccountsOfStoreTest, AnIdentifierOfATopLevelAccountAndAChildFindsTheTopLevelAccount) {
  insertWithChildren(account("P", kQuarxAccountType), {account("A", kCalDAVAccountType)});
  store_->insertAccount(account("A", kMailAccountType));

  const FullAccountReference found = store_->fullAccountWithIdentifier_loader("A", nullptr);

  EXPECT_EQ(dynamic_cast<RecordedFullAccount&>(*found).record.lock(),
            store_->allBasicAccounts().back());
}

TEST_F(FullAccountsOfStoreTest, EachAccountOfTheTypesIsFollowedByItsOwnChildrenOfTheTypes) {
  insertWithChildren(account("P1", kMailAccountType),
                     {account("C1", kMailAccountType), account("C2", kCalDAVAccountType)});
  insertWithChildren(account("P2", kMailAccountType), {account("C3", kMailAccountType)});

  EXPECT_EQ(identifiersOf(store_->accountsWithTypes({kMailAccountType})),
            (std::vector<std::string>{"P1", "C1", "P2", "C3"}));
}

TEST_F(FullAccountsOfStoreTest, ChildrenOfTheTypesAreFoundUnderAParentOfAnotherType) {
  insertWithChildren(account("P", kQuarxAccountType), {account("C", kMailAccountType)});

  EXPECT_EQ(identifiersOf(store_->accountsWithTypes({kMailAccountType})),
            std::vector<std::string>{"C"});
}

TEST_F(FullAccountsOfStoreTest, AChildThatItsParentListsTwiceIsGivenOutOnce) {
  insertWithChildren(account("P", kQuarxAccountType),
                     {account("C", kMailAccountType), account("C", kMailAccountType)});

  EXPECT_EQ(identifiersOf(store_->accountsWithTypes({kMailAccountType})),
            std::vector<std::string>{"C"});
}

TEST_F(FullAccountsOfStoreTest, AChildThatWentToAnotherParentIsGivenOutUnderThatOne) {
  insertWithChildren(account("P1", kQuarxAccountType), {account("C", kMailAccountType)});
  insertWithChildren(account("P2", kMailAccountType), {account("C", kMailAccountType)});

  EXPECT_EQ(identifiersOf(store_->accountsWithTypes({kMailAccountType})),
            (std::vector<std::string>{"P2", "C"}));
}

TEST_F(FullAccountsOfStoreTest, ALoaderIsAskedForEachAccount) {
  RecordingLoader loader;
  store_->insertAccount(account("A", kMailAccountType));
  store_->insertAccount(account("B", kMailAccountType));

  EXPECT_EQ(store_->accountsWithTypes_withLoader({kMailAccountType}, &loader).size(), 2U);
  EXPECT_EQ(loader.asked.size(), 2U);
}

TEST_F(FullAccountsOfStoreTest, MailAccountsAreThoseOfFourTypes) {
  store_->insertAccount(account("Y", kYahooAccountType));
  store_->insertAccount(account("D", kCalDAVAccountType));
  store_->insertAccount(account("G", kGmailAccountType));
  store_->insertAccount(account("M", kMailAccountType));
  // The hosted service's accounts have a class of its own.
  const BasicAccountReference hosted = account("V", kVelmoraAccountType);
  store_->insertAccount(hosted);

  EXPECT_EQ(identifiersOf(store_->allMailAccounts()),
            (std::vector<std::string>{"Y", "G", "M", "V"}));
}

TEST_F(FullAccountsOfStoreTest, TheDeviceLocalAccountIsCreatedWhereItIsMissing) {
  store_->insertAccount(account("A", kMailAccountType));

  const FullAccountReference deviceLocal = store_->fullDeviceLocalAccount();

  EXPECT_NE(deviceLocal, nullptr);
  ASSERT_EQ(store_->count(), 2U);
  EXPECT_EQ(store_->allBasicAccounts()[0]->identifier(), "A");
  EXPECT_EQ(store_->allBasicAccounts()[1]->identifier(), "DeviceLocalAccount");
  EXPECT_EQ(store_->allBasicAccounts()[1]->type(), kOnMyDeviceAccountType);
  const std::vector<std::string> lines = logSystem.channel.linesWithoutNumbers();
  EXPECT_NE(
      std::find(lines.begin(), lines.end(),
                R"(-[AccountsManager fullDeviceLocalAccount] (N) "DeviceLocalAccount missing. )"
                R"(Creating...")"),
      lines.end());
}

TEST_F(FullAccountsOfStoreTest, TheDeviceLocalAccountThatIsThereIsKept) {
  store_->insertAccount(BasicAccount::initWithProperties({{kAccountIdentifier, "OLD"},
                                                          {kAccountType, kOnMyDeviceAccountType},
                                                          {kAccountClass, "DeviceLocalAccount"}}));

  const FullAccountReference first = store_->fullDeviceLocalAccount();
  const FullAccountReference second = store_->fullDeviceLocalAccount();

  EXPECT_EQ(first, second);
  EXPECT_EQ(store_->count(), 1U);
  EXPECT_EQ(store_->allBasicAccounts()[0]->identifier(), "OLD");
}

}  // namespace
}  // namespace accounts
