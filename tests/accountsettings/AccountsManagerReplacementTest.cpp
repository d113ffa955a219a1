#include "accountsettings/DeviceLocalAccount.h"
#include "tests/accountsettings/StoreFixture.h"

namespace accounts {
namespace {

class AccountsManagerReplacement : public StoreFixture {
 protected:
  /// A record of a child account whose parent has an identifier.
  static BasicAccountReference childOf(std::string_view parentIdentifier,
                                       const AccountDictionary& child) {
    BasicAccountReference record = recordOf(child);
    record->setParentAccount(recordOf(mail(parentIdentifier)));
    return record;
  }
  /// The identifiers of the children in the properties of a top-level account.
  static std::string storedChildren(const AccountsManager& store, std::string_view identifier) {
    return identifiersOf(store.accountWithIdentifier(identifier)
                             ->arrayPropertyForKey(kAccountChildAccounts)
                             .value_or(PropertyArray()));
  }
};

TEST_F(AccountsManagerReplacement,
       AnAccountOfTheTypeWithAnotherIdentifierLeavesAndTheNewOneIsTheLast) {
  const Store store = storeOf({mail("A"), onMyDevice("B"), exchange("E")});
  const BasicAccountReference account = recordOf(onMyDevice("new"));
  store->replaceAccountsWithTypes_withAccounts({kOnMyDeviceAccountType}, {account});
  EXPECT_EQ(identifiersOf(store->allBasicAccounts()), "A E new");
  EXPECT_EQ(store->accountWithIdentifier("new"), account);
  EXPECT_EQ(store->accountWithIdentifier("B"), nullptr);
  EXPECT_EQ(
      takeLines(),
      Lines{
          R"(-[AccountsManager replaceAccountsWithTypes:withAccounts:] (N) "Replacing accounts")"});
}

TEST_F(AccountsManagerReplacement, AnAccountWithTheSameIdentifierKeepsItsPlace) {
  const Store store = storeOf({mail("A"), onMyDevice("B"), exchange("E")});
  const BasicAccountReference account = recordOf(onMyDevice("B"));
  store->replaceAccountsWithTypes_withAccounts({kOnMyDeviceAccountType}, {account});
  EXPECT_EQ(identifiersOf(store->allBasicAccounts()), "A B E");
  EXPECT_EQ(store->allBasicAccounts()[1], account);
  EXPECT_EQ(store->accountWithIdentifier("B"), account);
}

TEST_F(AccountsManagerReplacement, AnAccountOfAnotherTypeIsReplacedByIdentifierToo) {
  const Store store = storeOf({exchange("A"), mail("B")});
  store->replaceAccountsWithTypes_withAccounts({kMailAccountType}, {recordOf(mail("A"))});
  EXPECT_EQ(identifiersOf(store->allBasicAccounts()), "A");
  EXPECT_EQ(store->allBasicAccounts().front()->type(), Text(kMailAccountType));
}

TEST_F(AccountsManagerReplacement, AnEmptyListRemovesTheAccountsOfTheTypesAndTheirChildren) {
  const Store store = storeOf({mail("A").withChildren({calDAV("c")}),
                               exchange("B").withChildren({calDAV("d")}), mail("C"), calDAV("D")});
  store->replaceAccountsWithTypes_withAccounts({kMailAccountType, kCalDAVAccountType}, {});
  EXPECT_EQ(identifiersOf(store->allBasicSyncableAccounts()), "B d");
  EXPECT_EQ(store->accountWithIdentifier("A"), nullptr);
  EXPECT_EQ(store->accountWithIdentifier("c"), nullptr);
}

TEST_F(AccountsManagerReplacement, WithoutTypesAndAccountsNothingChanges) {
  const Store store = storeOf({mail("A").withChildren({calDAV("c")}), exchange("B")});
  const AccountsManager::Accounts before = store->allBasicAccounts();
  store->replaceAccountsWithTypes_withAccounts({}, {});
  EXPECT_EQ(store->allBasicAccounts(), before);
  EXPECT_EQ(childrenOf(*store), "c");
}

TEST_F(AccountsManagerReplacement, NewAccountsAreAppendedInTheirOwnOrder) {
  const Store store = storeOf({exchange("E"), mail("B")});
  store->replaceAccountsWithTypes_withAccounts(
      {kMailAccountType}, {recordOf(mail("Z")), recordOf(mail("B")), recordOf(mail("Y"))});
  EXPECT_EQ(identifiersOf(store->allBasicAccounts()), "E B Z Y");
}

TEST_F(AccountsManagerReplacement, TheStoresOwnListCanBeGivenBack) {
  const Store store = storeOf({mail("A"), exchange("B")});
  store->replaceAccountsWithTypes_withAccounts({kMailAccountType}, store->allBasicAccounts());
  EXPECT_EQ(identifiersOf(store->allBasicAccounts()), "A B");
}

TEST_F(AccountsManagerReplacement,
       OfTwoNewAccountsWithOneIdentifierTheLaterTakesThePlaceAndTheOtherIsAppended) {
  const Store store = storeOf({mail("A"), mail("B")});
  const BasicAccountReference first = recordOf(mail("A"));
  const BasicAccountReference second = recordOf(exchange("A"));
  store->replaceAccountsWithTypes_withAccounts({}, {first, second});
  EXPECT_EQ(identifiersOf(store->allBasicAccounts()), "A B A");
  EXPECT_EQ(store->allBasicAccounts().front(), second);
  EXPECT_EQ(store->allBasicAccounts().back(), first);
  EXPECT_EQ(store->accountWithIdentifier("A"), first);
}

TEST_F(AccountsManagerReplacement,
       EveryPlaceOfAnIdentifierIsTakenAndTheNewAccountIsNotAppendedAgain) {
  const Store store = storeOf({mail("A"), mail("B"), exchange("A")});
  const BasicAccountReference account = recordOf(mail("A"));
  store->replaceAccountsWithTypes_withAccounts({kMailAccountType}, {account});
  EXPECT_EQ(store->allBasicAccounts(), (AccountsManager::Accounts{account, account}));
}

TEST_F(AccountsManagerReplacement, OfKeptAccountsWithOneIdentifierTheFirstIsFound) {
  const Store store = storeOf({exchange("A"), exchange("A")});
  store->replaceAccountsWithTypes_withAccounts({kMailAccountType}, {});
  EXPECT_EQ(store->accountWithIdentifier("A"), store->allBasicAccounts().front());
}

TEST_F(AccountsManagerReplacement, AReplacedAccountsChildrenAreThoseOfTheNewOne) {
  const Store store = storeOf({mail("A").withChildren({calDAV("c"), calDAV("d")})});
  store->replaceAccountsWithTypes_withAccounts(
      {kMailAccountType}, {recordOf(mail("A").withChildren({calDAV("d"), calDAV("e")}))});
  EXPECT_EQ(childrenOf(*store), "d e");
  EXPECT_EQ(store->accountWithIdentifier("c"), nullptr);
}

TEST_F(AccountsManagerReplacement, AnAccountThatReplaceAccountPutInIsFoundFromThenOn) {
  const Store store = storeOf({mail("A")});
  store->replaceAccount_withAccount(store->accountWithIdentifier("A"), recordOf(mail("Q")));
  store->replaceAccountsWithTypes_withAccounts({kExchangeAccountType}, {});
  EXPECT_EQ(store->accountWithIdentifier("Q"), store->allBasicAccounts().front());
}

TEST_F(AccountsManagerReplacement, ANewChildGoesToItsParent) {
  const Store store = storeOf({mail("A").withChildren({calDAV("c")}), exchange("B")});
  store->replaceAccountsWithTypes_withAccounts({}, {childOf("A", calDAV("d"))});
  EXPECT_EQ(identifiersOf(store->allBasicAccounts()), "A B");
  EXPECT_EQ(storedChildren(*store, "A"), "c d");
  EXPECT_EQ(childrenOf(*store), "c d");
}

TEST_F(AccountsManagerReplacement, AChildThatIsThereIsReplacedByTheNewOne) {
  const Store store = storeOf({mail("A").withChildren({calDAV("c"), calDAV("d")})});
  store->replaceAccountsWithTypes_withAccounts(
      {}, {childOf("A", calDAV("c").with(kAccountDisplayName, "new"))});
  EXPECT_EQ(store->accountWithIdentifier("A")->properties(),
            PropertyDictionary(mail("A").withChildren(
                {calDAV("d"), calDAV("c").with(kAccountDisplayName, "new")})));
}

TEST_F(AccountsManagerReplacement, AChildThatGoesToAnotherParentLeavesItsOldOne) {
  const Store store = storeOf({mail("A").withChildren({calDAV("c")}), exchange("B")});
  store->replaceAccountsWithTypes_withAccounts({}, {childOf("B", calDAV("c"))});
  EXPECT_EQ(storedChildren(*store, "A"), "");
  EXPECT_EQ(storedChildren(*store, "B"), "c");
  EXPECT_EQ(identifiersOf({store->accountWithIdentifier("c")}), "B");
}

TEST_F(AccountsManagerReplacement, AChildLeavesTheRecordThatTookItsOldParentsPlace) {
  const Store store = storeOf({mail("A"), exchange("B")});
  store->replaceAccountsWithTypes_withAccounts(
      {kMailAccountType},
      {recordOf(mail("A").withChildren({calDAV("c")})), childOf("B", calDAV("c"))});
  EXPECT_EQ(storedChildren(*store, "A"), "");
  EXPECT_EQ(storedChildren(*store, "B"), "c");
}

TEST_F(AccountsManagerReplacement, OfTwoNewChildrenWithOneIdentifierTheLaterStays) {
  const Store store = storeOf({mail("A"), exchange("B")});
  store->replaceAccountsWithTypes_withAccounts(
      {}, {childOf("A", calDAV("c")), childOf("B", calDAV("c")), childOf("A", calDAV("c"))});
  EXPECT_EQ(storedChildren(*store, "A"), "c");
  EXPECT_EQ(storedChildren(*store, "B"), "");
  EXPECT_EQ(identifiersOf({store->accountWithIdentifier("c")}), "A");
}

TEST_F(AccountsManagerReplacement, AParentMayBeAmongTheNewAccountsBeforeItsChild) {
  const Store store = storeOf({mail("A").withChildren({calDAV("c")})});
  store->replaceAccountsWithTypes_withAccounts(
      {}, {recordOf(exchange("N")), childOf("N", calDAV("c"))});
  EXPECT_EQ(storedChildren(*store, "A"), "");
  EXPECT_EQ(storedChildren(*store, "N"), "c");
  EXPECT_EQ(identifiersOf({store->accountWithIdentifier("c")}), "N");
}

TEST_F(AccountsManagerReplacement,
       AChildOfAnAccountThatIsNotInTheStoreLeavesItsParentAndIsAddedNowhere) {
  const Store store = storeOf({mail("A").withChildren({calDAV("c")})});
  store->replaceAccountsWithTypes_withAccounts({}, {childOf("elsewhere", calDAV("c"))});
  EXPECT_EQ(identifiersOf(store->allBasicSyncableAccounts()), "A");
  EXPECT_EQ(storedChildren(*store, "A"), "");
}

TEST_F(AccountsManagerReplacement, AParentWhoseChildrenStayIsLeftAsItIs) {
  const AccountDictionary untouched = mail("A").withChildren({calDAV("c"), 17});
  const Store store = storeOf({untouched, exchange("B")});
  store->replaceAccountsWithTypes_withAccounts({}, {childOf("B", calDAV("d"))});
  EXPECT_EQ(store->accountWithIdentifier("A")->properties(), PropertyDictionary(untouched));
}

TEST_F(AccountsManagerReplacement, UnacceptableChildElementsStayWhenAChildIsAdded) {
  const Store store = storeOf({mail("A").withChildren({17, ofUnknownType("x")})});
  store->replaceAccountsWithTypes_withAccounts({}, {childOf("A", calDAV("c"))});
  EXPECT_EQ(store->accountWithIdentifier("A")->properties().arrayForKey(kAccountChildAccounts),
            (PropertyArray{17, PropertyValue(ofUnknownType("x")), PropertyValue(calDAV("c"))}));
}

TEST_F(AccountsManagerReplacement, AChildStaysWithAParentWhoseIdentifierIsNoLongerTheIndexedOne) {
  const Store store = storeOf({mail("A").withChildren({calDAV("c")}), exchange("B")});
  const BasicAccountReference parent = store->accountWithIdentifier("A");
  parent->setAccountProperty_forKey("A2", kAccountIdentifier);
  store->replaceAccountsWithTypes_withAccounts({}, {childOf("B", calDAV("c"))});
  EXPECT_EQ(parent->properties().arrayForKey(kAccountChildAccounts)->size(), 1U);
  EXPECT_EQ(storedChildren(*store, "B"), "c");
}

// The lines about children: each time that children are loaded, those that are unknown are named.

const std::string replacingLine =
    R"(-[AccountsManager replaceAccountsWithTypes:withAccounts:] (N) "Replacing accounts")";
std::string ignoringLine(std::string_view child) {
  return R"(-[AccountsManager _loadChildrenFromAccount:] (N) "Ignoring unknown child account with )"
         R"(properties )" +
         std::string(child) + '"';
}

TEST_F(AccountsManagerReplacement, AnAccountThatTakesSeveralPlacesHasItsChildrenLoadedInEach) {
  const Store store = storeOf({mail("A"), mail("B"), mail("A"), mail("A")});
  store->replaceAccountsWithTypes_withAccounts(
      {}, {recordOf(mail("A").withChildren({17})), recordOf(mail("B").withChildren({18}))});
  EXPECT_EQ(takeLines(), (Lines{replacingLine, ignoringLine("17"), ignoringLine("17"),
                                ignoringLine("18"), ignoringLine("17")}));
}

TEST_F(AccountsManagerReplacement, AnAccountThatIsAppendedTwiceHasItsChildrenLoadedTwice) {
  const Store store = storeOf({mail("A")});
  const BasicAccountReference twice = recordOf(mail("B").withChildren({17}));
  store->replaceAccountsWithTypes_withAccounts(
      {}, {twice, recordOf(mail("C").withChildren({18})), twice});
  EXPECT_EQ(identifiersOf(store->allBasicAccounts()), "A B C B");
  EXPECT_EQ(takeLines(),
            (Lines{replacingLine, ignoringLine("17"), ignoringLine("18"), ignoringLine("17")}));
}

TEST_F(AccountsManagerReplacement, AChildThatIsReplacedHasItsParentsChildrenLoadedTwice) {
  const Store store = storeOf({mail("A").withChildren({17, calDAV("c")})});
  takeLines();
  store->replaceAccountsWithTypes_withAccounts({}, {childOf("A", calDAV("c"))});
  EXPECT_EQ(takeLines(), (Lines{replacingLine, ignoringLine("17"), ignoringLine("17")}));
}

TEST_F(AccountsManagerReplacement, AnUnknownChildIsNamedEachTimeThatTheChildrenAreGoneThrough) {
  const Store store = storeOf({mail("A").withChildren({ofUnknownType("x"), calDAV("c")})});
  takeLines();
  store->replaceAccountsWithTypes_withAccounts({}, {childOf("A", calDAV("c"))});
  const std::string invalid =
      R"(-[BasicAccount initWithProperties:] (N) "Invalid account type: Carrier Pigeon")";
  const std::string ignoring =
      ignoringLine(R"({"Class":"PigeonAccount","Identifier":"x","Type":"Carrier Pigeon"})");
  // To find the child, to load the children without it, and to load them with the new one.
  EXPECT_EQ(takeLines(), (Lines{replacingLine, invalid, invalid, ignoring, invalid, ignoring}));
}

TEST_F(AccountsManagerReplacement, EachNewChildHasItsParentsChildrenLoaded) {
  const Store store = storeOf({mail("A").withChildren({17}), mail("B").withChildren({18})});
  takeLines();
  store->replaceAccountsWithTypes_withAccounts(
      {}, {childOf("A", calDAV("c")), childOf("B", calDAV("d")), childOf("A", calDAV("e"))});
  EXPECT_EQ(takeLines(),
            (Lines{replacingLine, ignoringLine("17"), ignoringLine("18"), ignoringLine("17")}));
}

TEST_F(AccountsManagerReplacement, AChildThatMovesHasTheChildrenOfBothParentsLoaded) {
  const Store store =
      storeOf({mail("A").withChildren({17, calDAV("c")}), mail("B").withChildren({18})});
  takeLines();
  store->replaceAccountsWithTypes_withAccounts({}, {childOf("B", calDAV("c"))});
  EXPECT_EQ(takeLines(), (Lines{replacingLine, ignoringLine("17"), ignoringLine("18")}));
}

// A record may answer otherwise than its property says: the property is what counts.

TEST_F(AccountsManagerReplacement, AccountsAreFoundUnderTheIdentifierPropertyNotTheRecordsAnswer) {
  const Store store = storeOf({mail("A")});
  const BasicAccountReference device = DeviceLocalAccount::initWithProperties(onMyDevice("stored"));
  ASSERT_NE(device->identifier(), Text("stored"));
  store->insertAccount(device);

  const BasicAccountReference successor = recordOf(onMyDevice("stored"));
  store->replaceAccountsWithTypes_withAccounts({}, {successor});

  EXPECT_EQ(store->allBasicAccounts().back(), successor);
  EXPECT_EQ(store->count(), 2u);
}

TEST_F(AccountsManagerReplacement, ANewAccountTakesThePlaceOfItsIdentifierPropertyNotOfItsAnswer) {
  const BasicAccountReference device = DeviceLocalAccount::initWithProperties(onMyDevice("stored"));
  const Store store = storeOf({mail(device->identifier()->view()), mail("stored")});

  store->replaceAccountsWithTypes_withAccounts({}, {device});

  EXPECT_EQ(store->allBasicAccounts().back(), device);
  EXPECT_EQ(store->count(), 2u);
}

TEST_F(AccountsManagerReplacement, KeptAndNewAccountsAreFoundByTheirIdentifierPropertyAfterIt) {
  const BasicAccountReference kept = DeviceLocalAccount::initWithProperties(onMyDevice("kept"));
  const BasicAccountReference added = DeviceLocalAccount::initWithProperties(onMyDevice("added"));
  const Store store = storeOf({});
  store->insertAccount(kept);

  store->replaceAccountsWithTypes_withAccounts({}, {added});

  EXPECT_EQ(store->accountWithIdentifier("kept"), kept);
  EXPECT_EQ(store->accountWithIdentifier("added"), added);
  EXPECT_EQ(store->accountWithIdentifier(*kept->identifier()), nullptr);
}

TEST_F(AccountsManagerReplacement, AChildStaysWithAParentThatAnswersWithTheIndexedIdentifier) {
  const BasicAccountReference parent =
      DeviceLocalAccount::initWithProperties(onMyDevice("stored").withChildren({calDAV("c")}));
  const Store store = storeOf({});
  store->insertAccount(parent);

  store->replaceAccountsWithTypes_withAccounts({}, {childOf("stored", calDAV("c"))});

  EXPECT_EQ(parent->properties().arrayForKey(kAccountChildAccounts)->size(), 1U);
}

}  // namespace
}  // namespace accounts
