#include "tests/accountsettings/StoreFixture.h"

namespace accounts {
namespace {

// A record gets an identifier when it is made, unless the device can make none. Such accounts have
// no place in any index, and must not be lost for that.
class AccountsWithoutIdentifier : public StoreFixture {
 protected:
  AccountsWithoutIdentifier() { device.uuidGenerator.canGenerate = false; }

  static AccountDictionary nameless(const AccountDictionary& account) {
    return account.without(kAccountIdentifier);
  }
};

TEST_F(AccountsWithoutIdentifier, AreInsertedEachTime) {
  const Store store = storeOf({mail("A")});

  store->insertAccount(recordOf(nameless(exchange(""))));
  store->insertAccount(recordOf(nameless(exchange(""))));

  EXPECT_EQ(identifiersOf(store->allBasicAccounts()), "A - -");
}

TEST_F(AccountsWithoutIdentifier, UpdateNothing) {
  const Store store = storeOf({mail("A"), nameless(mail(""))});

  store->updateAccount(recordOf(nameless(exchange(""))));

  EXPECT_EQ(store->countOfBasicAccountsWithTypes({kExchangeAccountType}), 0U);
  EXPECT_EQ(identifiersOf(store->allBasicAccounts()), "A -");
}

TEST_F(AccountsWithoutIdentifier, AreReplacedByAnother) {
  const Store store = storeOf({mail("A"), nameless(mail(""))});

  store->replaceAccount_withAccount(store->allBasicAccounts().at(1), recordOf(mail("B")));

  EXPECT_EQ(identifiersOf(store->allBasicAccounts()), "A B");
}

TEST_F(AccountsWithoutIdentifier, AreReplacedWithTheAccountsOfTheirType) {
  const Store store = storeOf({nameless(mail("")), nameless(exchange("")), mail("A")});

  store->replaceAccountsWithTypes_withAccounts({kMailAccountType}, {recordOf(mail("B"))});

  EXPECT_EQ(identifiersOf(store->allBasicAccounts()), "- B");
  EXPECT_EQ(store->allBasicAccounts().front()->type(), kExchangeAccountType);
}

TEST_F(AccountsWithoutIdentifier, AmongTheReplacementsAreAppended) {
  const Store store = storeOf({mail("A"), exchange("E")});

  store->replaceAccountsWithTypes_withAccounts(
      {kMailAccountType}, {recordOf(nameless(mail(""))), recordOf(nameless(mail("")))});

  EXPECT_EQ(identifiersOf(store->allBasicAccounts()), "E - -");
}

TEST_F(AccountsWithoutIdentifier, KeepTheirChildrenWhenAnotherParentGetsOne) {
  const Store store = storeOf({exchange("E")});
  const BasicAccountReference parent = recordOf(nameless(mail("")).withChildren({calDAV("c")}));
  const BasicAccountReference child = recordOf(calDAV("c"));
  child->setParentAccount(store->accountWithIdentifier("E"));

  store->replaceAccountsWithTypes_withAccounts({kMailAccountType}, {parent, child});

  EXPECT_EQ(identifiersOf(*parent->arrayPropertyForKey(kAccountChildAccounts)), "c");
  EXPECT_EQ(identifiersOf({store->accountWithIdentifier("c")}), "E");
}

TEST_F(AccountsWithoutIdentifier, AreSavedFromMemoryAlone) {
  const Store store = storeFromFileOf({nameless(mail("")).with(kAccountDisplayName, "before")});
  store->allBasicAccounts().front()->setDisplayName("after");
  writeSettings({nameless(mail("")).with(kAccountUsername, "of another program")});

  store->saveAllAccounts();

  EXPECT_EQ(settingsAccounts(),
            (PropertyArray{nameless(mail("")).with(kAccountDisplayName, "after")}));
}

TEST_F(AccountsWithoutIdentifier, AreSavedThoughTheFixerCannotKeepThem) {
  const Store store = storeOf({mail("A")});
  store->insertAccount(recordOf(nameless(mailThatCannotBeFixed(""))));

  store->saveAllAccounts();

  EXPECT_EQ(identifiersOf(settingsAccounts()), "A -");
}

TEST_F(AccountsWithoutIdentifier, OfOtherTypesArePassedOverWhenFullAccountsAreAskedFor) {
  const Store store = storeOf({nameless(exchange(""))});

  EXPECT_TRUE(store->accountsWithTypes({kMailAccountType}).empty());
}

class AccountsWithoutIdentifierDeathTest : public AccountsWithoutIdentifier {};

TEST_F(AccountsWithoutIdentifierDeathTest, HaveNoFullAccount) {
  const Store store = storeOf({nameless(mail(""))});

  EXPECT_DEATH(static_cast<void>(store->accountsWithTypes({kMailAccountType})),
               "The account with id \\(null\\) has no full account\n");
}

// Only a caller that forces it can take the type or the class from a record.
class AccountsWithoutType : public StoreFixture {
 protected:
  AccountsWithoutType() {
    store->allBasicAccounts().front()->_forcedSetAccountProperty_forKey(std::nullopt, kAccountType);
  }

  Store store = storeOf({mail("A"), mail("B")});
};

TEST_F(AccountsWithoutType, AreOfNoType) {
  EXPECT_EQ(identifiersOf(store->basicAccountsWithTypes({kMailAccountType, ""})), "B");
  EXPECT_EQ(store->accountWithIdentifier("A")->type(), std::nullopt);
}

TEST_F(AccountsWithoutType, HaveNoFullAccountsAmongThoseOfAnyType) {
  EXPECT_TRUE(store->accountsWithTypes({kExchangeAccountType, ""}).empty());
}

TEST_F(AccountsWithoutType, SupportNoDataclass) {
  EXPECT_TRUE(store->accountWithIdentifier("A")->supportedDataclasses().empty());
}

TEST_F(AccountsWithoutType, StayWhenAccountsOfTypesAreReplaced) {
  store->replaceAccountsWithTypes_withAccounts({kMailAccountType, ""}, {});

  EXPECT_EQ(identifiersOf(store->allBasicAccounts()), "A");
}

}  // namespace
}  // namespace accounts
