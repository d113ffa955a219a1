#include "propertylist/value/Description.h"
#include "tests/accountsettings/StoreFixture.h"

namespace accounts {
namespace {

class AccountsManagerMutations : public StoreFixture {
 protected:
  static PropertyDictionary propertiesOf(const AccountsManager& store,
                                         std::string_view identifier) {
    return store.accountWithIdentifier(identifier)->properties();
  }
};

TEST_F(AccountsManagerMutations, AnInsertedAccountIsTheLastAndIsFoundWithItsChildren) {
  const Store store = storeOf({mail("A")});
  const BasicAccountReference account = recordOf(mail("B").withChildren({calDAV("c")}));
  store->insertAccount(account);
  EXPECT_EQ(identifiersOf(store->allBasicAccounts()), "A B");
  EXPECT_EQ(store->accountWithIdentifier("c"), account);
  EXPECT_EQ(
      takeLines(),
      Lines{
          R"(-[AccountsManager insertAccount:] (N) "Inserting account: )"
          R"({"ChildAccounts":[{"Class":"MobileCalDAVAccount","Identifier":"c","Type":"CalDAV"}],)"
          R"("Class":"IMAPAccount","Identifier":"B","Type":"Mail"}")"});
}

TEST_F(AccountsManagerMutations, AnAccountWhoseIdentifierIsThereIsNotInserted) {
  const Store store = storeOf({mail("A").withChildren({calDAV("c")})});
  const BasicAccountReference present = store->accountWithIdentifier("A");
  store->insertAccount(recordOf(exchange("A")));
  EXPECT_EQ(store->allBasicAccounts(), AccountsManager::Accounts{present});
  EXPECT_EQ(store->accountWithIdentifier("A"), present);
  EXPECT_EQ(childrenOf(*store), "c");
  EXPECT_EQ(takeLines(),
            Lines{R"(-[AccountsManager insertAccount:] (N) "Inserting account: )"
                  R"({"Class":"MobileExchangeAccount","Identifier":"A","Type":"Exchange"}")"});
}

TEST_F(AccountsManagerMutations, AnAccountWithTheIdentifierOfAChildIsInserted) {
  const Store store = storeOf({mail("A").withChildren({calDAV("c")})});
  store->insertAccount(recordOf(mail("c")));
  EXPECT_EQ(identifiersOf(store->allBasicAccounts()), "A c");
}

TEST_F(AccountsManagerMutations, AnUpdatedAccountTakesThePlaceOfTheOneWithItsIdentifier) {
  const Store store = storeOf({mail("A").withChildren({calDAV("c")}), mail("B")});
  const BasicAccountReference account = recordOf(exchange("A").withChildren({calDAV("d")}));
  takeLines();
  store->updateAccount(account);
  EXPECT_EQ(identifiersOf(store->allBasicAccounts()), "A B");
  EXPECT_EQ(store->allBasicAccounts().front(), account);
  EXPECT_EQ(store->accountWithIdentifier("A"), account);
  EXPECT_EQ(childrenOf(*store), "d");
  EXPECT_EQ(takeLines().front(), "-[AccountsManager updateAccount:] (N) \"Updating account: " +
                                     describe(account->properties()) + "\"");
}

TEST_F(AccountsManagerMutations, AnUpdateTakesEveryPlaceOfTheIdentifier) {
  const Store store = storeOf({mail("A"), mail("B"), mail("A")});
  const BasicAccountReference account = recordOf(exchange("A"));
  store->updateAccount(account);
  EXPECT_EQ(store->allBasicAccounts()[0], account);
  EXPECT_EQ(store->allBasicAccounts()[2], account);
}

TEST_F(AccountsManagerMutations, AnUpdateLoadsTheChildrenOnceForEachPlaceThatItTakes) {
  const Store store = storeOf({mail("A"), mail("B"), mail("A")});
  store->updateAccount(recordOf(mail("A").withChildren({17})));
  const std::string ignoring =
      R"(-[AccountsManager _loadChildrenFromAccount:] (N) "Ignoring unknown child account with )"
      R"(properties 17")";
  EXPECT_EQ(takeLinesOf("-[AccountsManager _loadChildren"), (Lines{ignoring, ignoring}));
}

TEST_F(AccountsManagerMutations, AnUpdateOfAnAccountThatIsNotThereAddsNothing) {
  const Store store = storeOf({mail("A")});
  store->updateAccount(recordOf(mail("B").withChildren({calDAV("c")})));
  EXPECT_EQ(identifiersOf(store->allBasicSyncableAccounts()), "A");
  EXPECT_EQ(store->accountWithIdentifier("B"), nullptr);
}

TEST_F(AccountsManagerMutations, ADeletedAccountLeavesWithItsChildren) {
  const Store store =
      storeOf({mail("A").withChildren({calDAV("c")}), mail("B").withChildren({calDAV("d")})});
  store->deleteAccount(store->accountWithIdentifier("A"));
  EXPECT_EQ(identifiersOf(store->allBasicSyncableAccounts()), "B d");
  EXPECT_EQ(store->accountWithIdentifier("A"), nullptr);
  EXPECT_EQ(store->accountWithIdentifier("c"), nullptr);
  EXPECT_EQ(takeLines().front().substr(0, 58),
            R"(-[AccountsManager deleteAccount:] (N) "Deleting account: {)");
}

TEST_F(AccountsManagerMutations, AnAccountOfTheStoresOwnListCanBeDeleted) {
  const Store store = storeOf({mail("A"), mail("B"), mail("C")});
  store->deleteAccount(store->allBasicAccounts().front());
  store->deleteAccount(store->allBasicAccounts().front());
  EXPECT_EQ(identifiersOf(store->allBasicAccounts()), "C");
}

TEST_F(AccountsManagerMutations, AnAccountIsDeletedByIdentifierAndNotByIdentity) {
  const Store store = storeOf({mail("A"), mail("B")});
  store->deleteAccount(recordOf(exchange("A")));
  EXPECT_EQ(identifiersOf(store->allBasicAccounts()), "B");
}

TEST_F(AccountsManagerMutations,
       OfTwoAccountsWithOneIdentifierTheLastIsDeletedAndNoneIsFoundAnyMore) {
  const Store store = storeOf({mail("A"), mail("B"), exchange("A")});
  const BasicAccountReference first = store->allBasicAccounts().front();
  store->deleteAccountWithIdentifier("A");
  EXPECT_EQ(identifiersOf(store->allBasicAccounts()), "A B");
  EXPECT_EQ(store->allBasicAccounts().front(), first);
  EXPECT_EQ(store->accountWithIdentifier("A"), nullptr);
}

TEST_F(AccountsManagerMutations, DeletingAnAccountThatIsNotThereChangesNothing) {
  const Store store = storeOf({mail("A").withChildren({calDAV("c")})});
  store->deleteAccount(recordOf(mail("B")));
  EXPECT_EQ(identifiersOf(store->allBasicSyncableAccounts()), "A c");
}

TEST_F(AccountsManagerMutations, DeletingAnUnknownIdentifierLogsThatThereIsNoAccount) {
  const Store store = storeOf({mail("A").withChildren({calDAV("c")})});
  store->deleteAccountWithIdentifier("B");
  store->deleteAccountWithIdentifier("c");
  EXPECT_EQ(identifiersOf(store->allBasicSyncableAccounts()), "A c");
  const std::string line = "-[AccountsManager deleteAccount:] (N) \"Deleting account: (null)\"";
  EXPECT_EQ(takeLines(), (Lines{line, line}));
}

TEST_F(AccountsManagerMutations, AReplacingAccountTakesThePlaceButIsNotFoundByItsIdentifier) {
  const Store store = storeOf({mail("A"), mail("B").withChildren({calDAV("c")}), mail("C")});
  const BasicAccountReference replacement = recordOf(exchange("Q").withChildren({calDAV("d")}));
  store->replaceAccount_withAccount(store->accountWithIdentifier("B"), replacement);
  EXPECT_EQ(identifiersOf(store->allBasicAccounts()), "A Q C");
  EXPECT_EQ(store->accountWithIdentifier("Q"), nullptr);
  EXPECT_EQ(store->accountWithIdentifier("B"), nullptr);
  EXPECT_EQ(identifiersOf(store->basicAccountsWithTypes({kExchangeAccountType})), "Q");
  EXPECT_EQ(childrenOf(*store), "d");
  EXPECT_EQ(takeLines(), Lines{});
}

TEST_F(AccountsManagerMutations, AnInsertionDoesNotSeeAReplacingAccount) {
  const Store store = storeOf({mail("A")});
  store->replaceAccount_withAccount(store->accountWithIdentifier("A"), recordOf(exchange("Q")));
  store->insertAccount(recordOf(mail("Q")));
  EXPECT_EQ(identifiersOf(store->allBasicAccounts()), "Q Q");
}

TEST_F(AccountsManagerMutations, AReplacingAccountIsFoundAfterTheStoreIsSavedAndLoadedAgain) {
  const Store store = storeFromFileOf({mail("A")});
  store->replaceAccount_withAccount(store->accountWithIdentifier("A"), recordOf(exchange("Q")));
  store->saveAllAccounts();
  const Store loaded = AccountsManager::initInsideOfMigration();
  EXPECT_NE(loaded->accountWithIdentifier("Q"), nullptr);
}

TEST_F(AccountsManagerMutations, AnAccountOfTheStoresOwnListCanBeReplaced) {
  const Store store = storeOf({mail("A").withChildren({calDAV("c")})});
  store->replaceAccount_withAccount(store->allBasicAccounts().front(), recordOf(mail("Q")));
  EXPECT_EQ(identifiersOf(store->allBasicSyncableAccounts()), "Q");
}

TEST_F(AccountsManagerMutations, ReplacingAnAccountThatIsNotInTheStoreIsAProgrammingError) {
  const Store store = storeOf({mail("A")});
  EXPECT_DEATH(store->replaceAccount_withAccount(recordOf(mail("A")), recordOf(mail("B"))),
               R"(-\[AccountsManager replaceAccount:withAccount:\], AccountsManager: )"
               "The account to replace is not in the store");
}

TEST_F(AccountsManagerMutations, AnAddedChildIsTheLastOfItsParentAndIsIndexed) {
  const Store store = storeOf({mail("A").withChildren({calDAV("c")})});
  const BasicAccountReference parent = store->accountWithIdentifier("A");
  store->addChild_toAccount(recordOf(calDAV("d")), parent);
  EXPECT_EQ(parent->properties(),
            PropertyDictionary(mail("A").withChildren({calDAV("c"), calDAV("d")})));
  EXPECT_EQ(childrenOf(*store), "c d");
  EXPECT_EQ(takeLines(), Lines{});
}

TEST_F(AccountsManagerMutations, TheFirstChildMakesAListInThePlaceOfAnAbsentOne) {
  for (const AccountDictionary& parent :
       {mail("A"), mail("A").with(kAccountChildAccounts, "no list")}) {
    const Store store = storeOf({parent});
    store->addChild_toAccount(recordOf(calDAV("c")), store->accountWithIdentifier("A"));
    EXPECT_EQ(propertiesOf(*store, "A"), PropertyDictionary(mail("A").withChildren({calDAV("c")})));
  }
}

TEST_F(AccountsManagerMutations, AChildThatIsAddedTwiceIsStoredTwice) {
  const Store store = storeOf({mail("A").withChildren({calDAV("c")})});
  store->addChild_toAccount(recordOf(calDAV("c")), store->accountWithIdentifier("A"));
  EXPECT_EQ(propertiesOf(*store, "A"),
            PropertyDictionary(mail("A").withChildren({calDAV("c"), calDAV("c")})));
  EXPECT_EQ(childrenOf(*store), "c");
}

TEST_F(AccountsManagerMutations, EveryChildWithTheIdentifierIsRemoved) {
  const Store store = storeOf({mail("A").withChildren(
      {calDAV("c"), calDAV("d"), calDAV("c").with(kAccountDisplayName, "another")})});
  store->removeChildWithIdentifier_fromAccount("c", store->accountWithIdentifier("A"));
  EXPECT_EQ(propertiesOf(*store, "A"), PropertyDictionary(mail("A").withChildren({calDAV("d")})));
  EXPECT_EQ(childrenOf(*store), "d");
  EXPECT_EQ(takeLines(), Lines{});
}

TEST_F(AccountsManagerMutations, RemovingAnUnknownChildLeavesTheSameList) {
  const AccountDictionary parent = mail("A").withChildren({calDAV("c")});
  const Store store = storeOf({parent, mail("B").withChildren({calDAV("d")})});
  store->removeChildWithIdentifier_fromAccount("d", store->accountWithIdentifier("A"));
  EXPECT_EQ(propertiesOf(*store, "A"), PropertyDictionary(parent));
  EXPECT_EQ(store->count(), 2u);
  EXPECT_NE(store->accountWithIdentifier("c"), nullptr);
  EXPECT_NE(store->accountWithIdentifier("d"), nullptr);
}

TEST_F(AccountsManagerMutations, RemovingAChildWhereThereIsNoListStoresNone) {
  for (const AccountDictionary& parent :
       {mail("A"), mail("A").with(kAccountChildAccounts, "no list")}) {
    const Store store = storeOf({parent});
    store->removeChildWithIdentifier_fromAccount("c", store->accountWithIdentifier("A"));
    EXPECT_EQ(propertiesOf(*store, "A"), PropertyDictionary(parent));
  }
}

TEST_F(AccountsManagerMutations, UnacceptableChildElementsStayWhenAChildIsRemoved) {
  const Store store = storeOf({mail("A").withChildren({17, calDAV("c"), ofUnknownType("c")})});
  store->removeChildWithIdentifier_fromAccount("c", store->accountWithIdentifier("A"));
  EXPECT_EQ(propertiesOf(*store, "A"),
            PropertyDictionary(mail("A").withChildren({17, ofUnknownType("c")})));
}

TEST_F(AccountsManagerMutations, AChildWithoutAnIdentifierCannotBeRemovedByTheOneThatItHasNow) {
  const AccountDictionary parent = mail("A").withChildren({calDAV("").without(kAccountIdentifier)});
  const Store store = storeOf({parent});
  store->removeChildWithIdentifier_fromAccount(childrenOf(*store),
                                               store->accountWithIdentifier("A"));
  EXPECT_EQ(propertiesOf(*store, "A"), PropertyDictionary(parent));
}

TEST_F(AccountsManagerMutations, NothingReachesTheFileBeforeASave) {
  const Store store = storeFromFileOf({mail("A"), mail("B")});
  device.journal.clear();
  store->insertAccount(recordOf(mail("C")));
  store->updateAccount(recordOf(exchange("A")));
  store->deleteAccountWithIdentifier("B");
  store->addChild_toAccount(recordOf(calDAV("c")), store->accountWithIdentifier("A"));
  store->replaceAccountsWithTypes_withAccounts({kMailAccountType}, {});
  EXPECT_EQ(device.journal, std::vector<std::string>{});
}

}  // namespace
}  // namespace accounts
