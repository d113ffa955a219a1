#include "tests/accountsettings/StoreFixture.h"

namespace accounts {
namespace {

class AccountsManagerQueries : public StoreFixture {
 protected:
  /// The identifier of an account that was asked for, "none" for null.
  static std::string identifierOf(const BasicAccountReference& account) {
    return account ? identifiersOf({account}) : "none";
  }
  static AccountDictionary syncing(const AccountDictionary& account, std::string_view identifier) {
    return account.with(kAccountSyncIdentifier, identifier);
  }
};

TEST_F(AccountsManagerQueries, AnAccountIsFoundByItsIdentifier) {
  const Store store = storeOf({mail("A"), mail("B")});
  EXPECT_EQ(store->accountWithIdentifier("B"), store->allBasicAccounts().back());
}

TEST_F(AccountsManagerQueries, AChildsIdentifierFindsItsTopLevelParent) {
  const Store store = storeOf({mail("A"), mail("B").withChildren({calDAV("c")})});
  EXPECT_EQ(store->accountWithIdentifier("c"), store->allBasicAccounts().back());
}

TEST_F(AccountsManagerQueries, AnIdentifierOfATopLevelAccountAndAChildFindsTheTopLevelAccount) {
  const Store store = storeOf({mail("A"), mail("B").withChildren({calDAV("A")})});
  EXPECT_EQ(store->accountWithIdentifier("A"), store->allBasicAccounts().front());
}

TEST_F(AccountsManagerQueries, AnUnknownIdentifierFindsNothing) {
  const Store store = storeOf({mail("A")});
  EXPECT_EQ(store->accountWithIdentifier("B"), nullptr);
  EXPECT_EQ(store->accountWithIdentifier(""), nullptr);
}

TEST_F(AccountsManagerQueries, TheListOfAccountsIsTheStoresOwn) {
  const Store store = storeOf({mail("A")});
  const AccountsManager::Accounts& accounts = store->allBasicAccounts();
  store->insertAccount(recordOf(mail("B")));
  EXPECT_EQ(identifiersOf(accounts), "A B");
  EXPECT_EQ(&store->allBasicAccounts(), &accounts);
}

TEST_F(AccountsManagerQueries, SyncableAccountsAreTheTopLevelAccountsAndThenTheChildren) {
  const Store store = storeOf(
      {mail("A").withChildren({calDAV("z"), calDAV("y")}), mail("B").withChildren({calDAV("x")})});
  EXPECT_EQ(identifiersOf(store->allBasicSyncableAccounts()), "A B z y x");
}

TEST_F(AccountsManagerQueries, AccountsOfTypesAreTopLevelAccountsInStoreOrder) {
  const Store store =
      storeOf({exchange("E"), calDAV("C"), mail("A").withChildren({calDAV("c")}), mail("B")});
  EXPECT_EQ(identifiersOf(store->basicAccountsWithTypes({kMailAccountType, kExchangeAccountType})),
            "E A B");
  EXPECT_EQ(identifiersOf(store->basicAccountsWithTypes({kCalDAVAccountType})), "C");
  EXPECT_EQ(identifiersOf(store->basicAccountsWithTypes({})), "");
}

TEST_F(AccountsManagerQueries, CountsCountTopLevelAccountsOnly) {
  const Store store = storeOf({mail("A").withChildren({calDAV("c"), mail("d")}), exchange("E")});
  EXPECT_EQ(store->count(), 2u);
  EXPECT_EQ(store->countOfBasicAccountsWithTypes({kMailAccountType}), 1u);
  EXPECT_EQ(store->countOfBasicAccountsWithTypes({kCalDAVAccountType}), 0u);
}

TEST_F(AccountsManagerQueries, EveryPlaceOfADuplicateIdentifierCounts) {
  const Store store = storeOf({mail("A"), mail("A")});
  EXPECT_EQ(store->count(), 2u);
  EXPECT_EQ(store->countOfBasicAccountsWithTypes({kMailAccountType}), 2u);
}

TEST_F(AccountsManagerQueries, AnAccountIsFoundByItsSyncIdentifier) {
  const Store store = storeOf({syncing(mail("A"), "s"), syncing(mail("B"), "t")});
  EXPECT_EQ(identifierOf(store->syncableAccountWithSyncIdentifier("t")), "B");
  EXPECT_EQ(identifierOf(store->syncableAccountWithSyncIdentifier("u")), "none");
}

TEST_F(AccountsManagerQueries, TopLevelAccountsAreFoundBeforeChildren) {
  const Store store =
      storeOf({mail("A").withChildren({syncing(calDAV("c"), "s")}), syncing(mail("B"), "s")});
  EXPECT_EQ(identifierOf(store->syncableAccountWithSyncIdentifier("s")), "B");
}

TEST_F(AccountsManagerQueries, OfSeveralAccountsTheFirstOneIsFoundByTheSyncIdentifier) {
  const Store store = storeOf({syncing(mail("B"), "s"), syncing(mail("A"), "s")});
  EXPECT_EQ(identifierOf(store->syncableAccountWithSyncIdentifier("s")), "B");
}

TEST_F(AccountsManagerQueries, AChildIsFoundByItsSyncIdentifierButItsParentIsShown) {
  const Store store = storeOf({mail("A").withChildren({syncing(calDAV("c"), "s")})});
  EXPECT_EQ(identifierOf(store->syncableAccountWithSyncIdentifier("s")), "c");
  EXPECT_EQ(identifierOf(store->displayAccountWithSyncIdentifier("s")), "A");
}

TEST_F(AccountsManagerQueries, ATopLevelAccountFoundByItsSyncIdentifierIsShownItself) {
  const Store store = storeOf({syncing(mail("A"), "s")});
  EXPECT_EQ(identifierOf(store->displayAccountWithSyncIdentifier("s")), "A");
  EXPECT_EQ(identifierOf(store->displayAccountWithSyncIdentifier("t")), "none");
}

TEST_F(AccountsManagerQueries, AChangedSyncIdentifierIsFoundFromThenOn) {
  const Store store = storeOf({syncing(mail("A"), "s")});
  ASSERT_EQ(identifierOf(store->syncableAccountWithSyncIdentifier("s")), "A");
  store->accountWithIdentifier("A")->setAccountProperty_forKey("t", kAccountSyncIdentifier);
  EXPECT_EQ(identifierOf(store->syncableAccountWithSyncIdentifier("t")), "A");
  EXPECT_EQ(identifierOf(store->syncableAccountWithSyncIdentifier("s")), "none");
}

TEST_F(AccountsManagerQueries, AChildWithoutASyncIdentifierFollowsItsParents) {
  const Store store =
      storeOf({syncing(mail("A"), "s").withChildren({calDAV("c")}), syncing(mail("B"), "t")});
  ASSERT_EQ(identifierOf(store->syncableAccountWithSyncIdentifier("s")), "A");
  const BasicAccountReference child = store->allBasicSyncableAccounts().back();
  store->deleteAccountWithIdentifier("B");
  ASSERT_EQ(identifierOf(store->syncableAccountWithSyncIdentifier("u")), "none");
  child->setParentAccount(recordOf(syncing(mail("elsewhere"), "u")));
  EXPECT_EQ(store->syncableAccountWithSyncIdentifier("u"), child);
}

TEST_F(AccountsManagerQueries, AnAccountThatLeftTheStoreIsNoLongerFoundByItsSyncIdentifier) {
  const Store store = storeOf({syncing(mail("A"), "s"), syncing(mail("B"), "s")});
  ASSERT_EQ(identifierOf(store->syncableAccountWithSyncIdentifier("s")), "A");
  store->deleteAccountWithIdentifier("A");
  EXPECT_EQ(identifierOf(store->syncableAccountWithSyncIdentifier("s")), "B");
  store->insertAccount(recordOf(syncing(mail("C"), "u")));
  EXPECT_EQ(identifierOf(store->syncableAccountWithSyncIdentifier("u")), "C");
}

TEST_F(AccountsManagerQueries, AReplacingAccountIsFoundByItsSyncIdentifier) {
  const Store store = storeOf({syncing(mail("A"), "s")});
  ASSERT_EQ(identifierOf(store->syncableAccountWithSyncIdentifier("s")), "A");
  store->replaceAccountsWithTypes_withAccounts({kMailAccountType},
                                               {recordOf(syncing(mail("B"), "t"))});
  EXPECT_EQ(identifierOf(store->syncableAccountWithSyncIdentifier("t")), "B");
  EXPECT_EQ(identifierOf(store->syncableAccountWithSyncIdentifier("s")), "none");
}

TEST_F(AccountsManagerQueries, AfterAReplacementTheFirstOfSeveralAccountsIsStillFound) {
  const Store store = storeOf({syncing(mail("B"), "s"), syncing(mail("A"), "s")});
  store->replaceAccountsWithTypes_withAccounts({kExchangeAccountType}, {});
  EXPECT_EQ(identifierOf(store->syncableAccountWithSyncIdentifier("s")), "B");
}

TEST_F(AccountsManagerQueries, AChildThatIsAddedIsFoundByItsSyncIdentifierFromThenOn) {
  const Store store = storeOf({mail("A")});
  const BasicAccountReference child = recordOf(syncing(calDAV("c"), "s"));
  ASSERT_EQ(identifierOf(store->syncableAccountWithSyncIdentifier("s")), "none");
  store->addChild_toAccount(child, store->accountWithIdentifier("A"));
  EXPECT_EQ(identifierOf(store->syncableAccountWithSyncIdentifier("s")), "c");
}

TEST_F(AccountsManagerQueries, AChildThatIsRemovedIsFoundByItsSyncIdentifierNoMore) {
  const Store store = storeOf({mail("A").withChildren({syncing(calDAV("c"), "s")})});
  ASSERT_EQ(identifierOf(store->syncableAccountWithSyncIdentifier("s")), "c");
  store->_removeChildrenForAccountWithIdentifier(Text("A"));
  EXPECT_EQ(identifierOf(store->syncableAccountWithSyncIdentifier("s")), "none");
}

}  // namespace
}  // namespace accounts
