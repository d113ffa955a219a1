#include "tests/accountsettings/StoreFixture.h"

namespace accounts {
namespace {

using AccountsManagerChildren = StoreFixture;

TEST_F(AccountsManagerChildren, ChildrenAreIndexedUnderTheirParent) {
  const Store store = storeOf({mail("A").withChildren({calDAV("c"), calDAV("d")}), mail("B")});
  EXPECT_EQ(childrenOf(*store), "c d");
  EXPECT_EQ(store->allBasicSyncableAccounts().back()->parentAccount(),
            store->allBasicAccounts().front());
}

TEST_F(AccountsManagerChildren, AChildOfAnUnknownTypeIsIgnoredWithALineAndStaysInItsParent) {
  const AccountDictionary parent = mail("A").withChildren({ofUnknownType("x"), calDAV("c")});
  const Store store = storeFromFileOf({parent});
  EXPECT_EQ(childrenOf(*store), "c");
  EXPECT_EQ(store->accountWithIdentifier("x"), nullptr);
  EXPECT_EQ(takeLinesOf("-[AccountsManager"),
            Lines{R"(-[AccountsManager _loadChildrenFromAccount:] (N) )"
                  R"("Ignoring unknown child account with properties )"
                  R"({"Class":"PigeonAccount","Identifier":"x","Type":"Carrier Pigeon"}")"});
  store->saveAllAccounts();
  EXPECT_EQ(settingsAccount(0), PropertyDictionary(parent));
}

TEST_F(AccountsManagerChildren, AChildElementThatIsNoDictionaryIsIgnoredWithALineAndStays) {
  const AccountDictionary parent = mail("A").withChildren({17, calDAV("c")});
  const Store store = storeFromFileOf({parent});
  EXPECT_EQ(childrenOf(*store), "c");
  EXPECT_EQ(takeLines(), Lines{R"(-[AccountsManager _loadChildrenFromAccount:] (N) )"
                               R"("Ignoring unknown child account with properties 17")"});
  store->saveAllAccounts();
  EXPECT_EQ(settingsAccount(0), PropertyDictionary(parent));
}

TEST_F(AccountsManagerChildren, ChildrenThatAreNoArrayAreAbsentAndStayStored) {
  const AccountDictionary parent = mail("A").with(kAccountChildAccounts, calDAV("c"));
  const Store store = storeFromFileOf({parent});
  EXPECT_EQ(childrenOf(*store), "");
  EXPECT_EQ(takeLines(), Lines{});
  store->saveAllAccounts();
  EXPECT_EQ(settingsAccount(0), PropertyDictionary(parent));
}

TEST_F(AccountsManagerChildren, ChildrenOfChildrenAreCarriedButNotIndexed) {
  const AccountDictionary parent =
      mail("A").withChildren({calDAV("c").withChildren({calDAV("grandchild")})});
  const Store store = storeFromFileOf({parent});
  EXPECT_EQ(childrenOf(*store), "c");
  EXPECT_EQ(store->accountWithIdentifier("grandchild"), nullptr);
  store->saveAllAccounts();
  EXPECT_EQ(settingsAccount(0), PropertyDictionary(parent));
}

TEST_F(AccountsManagerChildren, AChildWithoutAnIdentifierIsIndexedUnderAFreshOne) {
  const Store store = storeOf({mail("A").withChildren({calDAV("").without(kAccountIdentifier)})});
  EXPECT_EQ(childrenOf(*store), "00000000-0000-0000-0000-000000000001");
}

TEST_F(AccountsManagerChildren, OfTwoChildrenWithTheSameIdentifierTheLaterIsIndexed) {
  const Store store =
      storeOf({mail("A").withChildren({calDAV("c").with(kAccountDisplayName, "first"),
                                       calDAV("c").with(kAccountDisplayName, "second")})});
  EXPECT_EQ(childrenOf(*store), "c");
  EXPECT_EQ(store->allBasicSyncableAccounts().back()->displayName(), Text("second"));
}

TEST_F(AccountsManagerChildren, AChildOfTwoParentsBelongsToTheOneLoadedLast) {
  const Store store =
      storeOf({mail("A").withChildren({calDAV("c")}), mail("B").withChildren({calDAV("c")})});
  EXPECT_EQ(childrenOf(*store), "c");
  EXPECT_EQ(identifiersOf({store->accountWithIdentifier("c")}), "B");
}

TEST_F(AccountsManagerChildren, LoadingAgainTakesTheChildrenThatAreThereNow) {
  const Store store = storeOf({mail("A").withChildren({calDAV("c"), calDAV("d")})});
  const BasicAccountReference parent = store->accountWithIdentifier("A");
  parent->setAccountProperty_forKey(PropertyArray{calDAV("d"), calDAV("e")}, kAccountChildAccounts);
  EXPECT_EQ(childrenOf(*store), "c d");
  store->_loadChildrenFromAccount(parent);
  EXPECT_EQ(childrenOf(*store), "d e");
  EXPECT_EQ(store->accountWithIdentifier("c"), nullptr);
}

TEST_F(AccountsManagerChildren, AParentThatIsLoadedAgainWithoutAChildLeavesItToTheOtherParent) {
  const Store store =
      storeOf({mail("A").withChildren({calDAV("c")}), mail("B").withChildren({calDAV("c")})});
  const BasicAccountReference first = store->accountWithIdentifier("A");
  first->removeAccountPropertyForKey(kAccountChildAccounts);
  store->_loadChildrenFromAccount(first);
  EXPECT_EQ(identifiersOf({store->accountWithIdentifier("c")}), "B");
}

TEST_F(AccountsManagerChildren, RemovingTheChildrenOfAParentLeavesItsPropertyAndOtherParents) {
  const AccountDictionary parent = mail("A").withChildren({calDAV("c"), calDAV("d")});
  const Store store = storeOf({parent, mail("B").withChildren({calDAV("e")})});
  store->_removeChildrenForAccountWithIdentifier(Text("A"));
  EXPECT_EQ(childrenOf(*store), "e");
  EXPECT_EQ(store->accountWithIdentifier("c"), nullptr);
  EXPECT_EQ(store->accountWithIdentifier("A")->properties(), PropertyDictionary(parent));
}

TEST_F(AccountsManagerChildren, RemovingTheChildrenOfNoParentChangesNothing) {
  const Store store = storeOf({mail("A").withChildren({calDAV("c")})});
  store->_removeChildrenForAccountWithIdentifier(std::nullopt);
  store->_removeChildrenForAccountWithIdentifier(Text("B"));
  EXPECT_EQ(childrenOf(*store), "c");
}

TEST_F(AccountsManagerChildren, AParentThatGetsNoIdentifierHasNoIndexedChildren) {
  device.uuidGenerator.canGenerate = false;
  const Store store = storeOf({mail("").without(kAccountIdentifier).withChildren({calDAV("c")})});
  EXPECT_EQ(childrenOf(*store), "");
  EXPECT_EQ(takeLinesOf("-[AccountsManager _loadChildrenFromAccount:]"), Lines{});
}

}  // namespace
}  // namespace accounts
