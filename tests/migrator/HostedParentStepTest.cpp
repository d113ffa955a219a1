#include "tests/migrator/MigratorFixture.h"

// The step of 8B117: parent accounts for the hosted mail service.

namespace accounts {
namespace {

class HostedParentStepTest : public StepTest {
 protected:
  static AccountDictionary hosted() {
    return anAccount("V", kVelmoraAccountType, "VelmoraAccount");
  }
  void runStep() { EXPECT_TRUE(migrator._migrateAccountsFrom8B117(*store)); }
  void runStepOn(const AccountDictionary& builder) {
    openStoreWith({builder});
    runStep();
  }
  /// The old account, now the last child of the parent at the first position.
  PropertyDictionary child() {
    const PropertyArray list = children(0);
    return *list.at(list.size() - 1).asDictionary();
  }
};

const AccountDictionary calendarChild = anAccount("K1", kCalDAVAccountType, "MobileCalDAVAccount");
const AccountDictionary contactsChild = anAccount("K2", kCardDAVAccountType, "CardDAVAccount");

TEST_F(HostedParentStepTest, AnActiveAccountWithChildrenBecomesTheChildOfAParent) {
  runStepOn(hosted()
                .with(kAccountUsername, "jdoe")
                .with("IsActive", true)
                .enabledFor({kAccountDataclassCalendars})
                .withChildren({calendarChild, contactsChild}));

  ASSERT_EQ(store->count(), 1u);
  EXPECT_EQ(account(0).type(), kQuarxAccountType);
  EXPECT_EQ(account(0).accountClass(), "VelmoraAccount");
  EXPECT_EQ(account(0).textPropertyForKey(kAccountUsername), "jdoe@velmora.example");
  EXPECT_EQ(texts(account(0).enabledDataclasses()),
            dataclasses({kAccountDataclassMail, kAccountDataclassCalendars}));
  ASSERT_EQ(children(0).size(), 3u);
  EXPECT_EQ(children(0).at(0), PropertyValue(calendarChild));
  EXPECT_EQ(children(0).at(1), PropertyValue(contactsChild));
  EXPECT_EQ(child(), hosted().with(kAccountUsername, "jdoe").with("IsActive", true));
}

TEST_F(HostedParentStepTest, TheParentIsProvisionedForWhatTheOldAccountSupports) {
  runStepOn(hosted().provisionedFor({kAccountDataclassMail}));

  const BasicAccountReference old = BasicAccount::initWithProperties(hosted());
  EXPECT_EQ(texts(account(0).properties().arrayForKey(kAccountProvisionedDataclasses)),
            texts(old->supportedDataclasses()));
}

TEST_F(HostedParentStepTest, TheParentGetsAnIdentifierAndAnEqualSyncIdentifier) {
  runStepOn(hosted());

  EXPECT_EQ(account(0).identifier(), "00000000-0000-0000-0000-000000000001");
  EXPECT_EQ(account(0).syncStoreIdentifier(), account(0).identifier());
}

TEST_F(HostedParentStepTest, TheOldAccountIsFoundAsAChildOfTheParent) {
  runStepOn(hosted());

  const AccountsManager::Accounts all = store->allBasicSyncableAccounts();
  ASSERT_EQ(all.size(), 2u);
  EXPECT_EQ(all[1]->identifier(), "V");
  EXPECT_EQ(all[1]->parentAccount(), all[0]);
}

TEST_F(HostedParentStepTest, TheOldRecordKnowsItsParent) {
  openStoreWith({hosted()});
  const BasicAccountReference old = store->allBasicAccounts().front();

  runStep();

  EXPECT_EQ(old->parentAccount(), store->allBasicAccounts().front());
}

TEST_F(HostedParentStepTest, WhatIsCopiedMayBeInheritedWhileOnlyOwnValuesAreMoved) {
  const BasicAccountReference old = BasicAccount::initWithProperties(hosted());
  old->setParentAccount(BasicAccount::initWithProperties(
      hosted()
          .with(kAccountUsername, "jdoe@host")
          .with(kAccountDisplayName, "Home")
          .with("CalDAVEnabled", true)
          .enabledFor({kAccountDataclassCalendars})
          .withChildren({calendarChild})
          .with(kCalendarsAccountSubscribedCalendars, PropertyArray{1})
          .with("DAExoSubscribedCalendarInfos", PropertyArray{2})));
  store->insertAccount(old);

  runStep();

  const PropertyDictionary parent = account(0).properties();
  EXPECT_EQ(parent.textForKey(kAccountUsername), "jdoe@host");
  EXPECT_EQ(parent.textForKey(kAccountDisplayName), "Home");
  EXPECT_EQ(*parent.find("CalDAVEnabled"), PropertyValue(true));
  EXPECT_FALSE(parent.contains(kAccountEnabledDataclasses));
  EXPECT_EQ(children(0), PropertyArray{hosted()});
  EXPECT_FALSE(parent.contains(kCalendarsAccountSubscribedCalendars));
  EXPECT_FALSE(parent.contains("DAExoSubscribedCalendarInfos"));
}

TEST_F(HostedParentStepTest, TheTypeStringsAreThoseOfTheService) {
  runStepOn(hosted().with(kAccountTypeString, "Other"));

  EXPECT_EQ(account(0).typeString(), "Velmora");
  EXPECT_EQ(account(0).shortTypeString(), "Velmora");
  EXPECT_EQ(child().textForKey(kAccountTypeString), "Other");
}

TEST_F(HostedParentStepTest, TheEarliestServiceHasADomainOfItsOwn) {
  runStepOn(anAccount("V", kVelmoraAccountType, "MarrowAccount").with(kAccountUsername, "jdoe"));

  EXPECT_EQ(account(0).accountClass(), "MarrowAccount");
  EXPECT_EQ(account(0).textPropertyForKey(kAccountUsername), "jdoe@marrow.example");
}

TEST_F(HostedParentStepTest, AFullAddressIsKept) {
  runStepOn(hosted().with(kAccountUsername, "jdoe@host"));

  EXPECT_EQ(account(0).textPropertyForKey(kAccountUsername), "jdoe@host");
}

TEST_F(HostedParentStepTest, AUserNameThatIsNoTextIsNotPutIntoTheParent) {
  runStepOn(hosted().with(kAccountUsername, 5));

  EXPECT_FALSE(account(0).properties().contains(kAccountUsername));
  EXPECT_TRUE(child().contains(kAccountUsername));
}

TEST_F(HostedParentStepTest, CopiedValuesStayWithTheOldAccount) {
  runStepOn(hosted().with(kAccountDisplayName, "Home").with("CalDAVEnabled", true));

  EXPECT_EQ(*account(0).properties().find(kAccountDisplayName), PropertyValue("Home"));
  EXPECT_EQ(*account(0).properties().find("CalDAVEnabled"), PropertyValue(true));
  EXPECT_EQ(child(), hosted().with(kAccountDisplayName, "Home").with("CalDAVEnabled", true));
}

TEST_F(HostedParentStepTest, MovedValuesOfAnyKindLeaveTheOldAccount) {
  const PropertyArray calendars = {PropertyDictionary{{"Name", "Holidays"}}};
  runStepOn(hosted()
                .with(kCalendarsAccountSubscribedCalendars, calendars)
                .with("DAExoSubscribedCalendarInfos", "of another kind"));

  EXPECT_EQ(*account(0).properties().find(kCalendarsAccountSubscribedCalendars),
            PropertyValue(calendars));
  EXPECT_EQ(*account(0).properties().find("DAExoSubscribedCalendarInfos"),
            PropertyValue("of another kind"));
  EXPECT_EQ(child(), PropertyDictionary(hosted()));
}

TEST_F(HostedParentStepTest, ValuesThatTheOldAccountLacksTheParentLacksToo) {
  runStepOn(hosted());

  for (const std::string_view key :
       {kAccountUsername, kAccountDisplayName, kAccountEnabledDataclasses,
        kCalendarsAccountSubscribedCalendars, std::string_view("CalDAVEnabled"),
        std::string_view("DAExoSubscribedCalendarInfos"), std::string_view("IsActive")}) {
    EXPECT_FALSE(account(0).properties().contains(key)) << key;
  }
}

TEST_F(HostedParentStepTest, AnAbsentIsActiveCountsAsInactiveForTheParentAccount) {
  runStepOn(hosted());

  EXPECT_FALSE(account(0).isEnabledForDataclass(kAccountDataclassMail));
}

TEST_F(HostedParentStepTest, ARecordInSeveralPlacesIsTheOnlyChildOfEachOfItsParents) {
  openStoreWith({hosted(), hosted()});
  store->updateAccount(store->allBasicAccounts().back());

  migrator._migrateAccountsFrom8B117(*store);

  EXPECT_EQ(children(0).size(), 1u);
  EXPECT_EQ(children(1).size(), 1u);
}

TEST_F(HostedParentStepTest, AnInactiveAccountsParentGetsNoMail) {
  runStepOn(hosted().with("IsActive", false).enabledFor({kAccountDataclassNotes}));

  EXPECT_EQ(texts(account(0).enabledDataclasses()), dataclasses({kAccountDataclassNotes}));
}

TEST_F(HostedParentStepTest, ParentsTakeThePlacesOfTheirAccounts) {
  openStoreWith({anAccount("A", kMailAccountType, "IMAPAccount"), hosted(),
                 anAccount("B", kMailAccountType, "IMAPAccount"),
                 anAccount("W", kVelmoraAccountType, "MarrowAccount"),
                 anAccount("Z", kQuarxAccountType, "ZQAccount")});

  runStep();

  EXPECT_EQ(identifiers(), (TextList{"A", "00000000-0000-0000-0000-000000000001", "B",
                                     "00000000-0000-0000-0000-000000000002", "Z"}));
}

TEST_F(HostedParentStepTest, WithoutAHostedServiceAccountTheStoreIsSavedUnchanged) {
  const AccountDictionary other =
      anAccount("Z", kQuarxAccountType, "ZQAccount").with("IsActive", true);

  runStepOn(other);

  EXPECT_EQ(account(0).properties(), PropertyDictionary(other));
  EXPECT_EQ(saves(), 1);
}

TEST_F(HostedParentStepTest, AParentTypeUnknownToTheConfigurationLeavesTheAccount) {
  device.bundleResources.replaced["AccountTypesProperties"] =
      PropertyDictionary{{kVelmoraAccountType, PropertyDictionary()}};
  const AccountDictionary old = hosted().enabledFor({kAccountDataclassMail});

  runStepOn(old);

  EXPECT_EQ(account(0).properties(), PropertyDictionary(old));
}

TEST_F(HostedParentStepTest, TheParentIsInTheFile) {
  runStepOn(hosted());

  const PropertyArray saved = *settingsFile()->arrayForKey(kPlistAccountsKey);
  ASSERT_EQ(saved.size(), 1u);
  EXPECT_EQ(saved.at(0).asDictionary()->textForKey(kAccountType), kQuarxAccountType);
}

}  // namespace
}  // namespace accounts
