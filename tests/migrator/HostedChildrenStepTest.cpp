#include "tests/migrator/MigratorFixture.h"

// The step of 8C136: hosted-service children and web mail.

namespace accounts {
namespace {

class HostedChildrenStepTest : public StepTest {
 protected:
  static AccountDictionary cloudAccount() { return anAccount("Z", kQuarxAccountType, "ZQAccount"); }
  PropertyArray childrenAfterTheStep(const AccountDictionary& builder) {
    openStoreWith({builder});
    EXPECT_TRUE(migrator._migrateAccountsFrom8C136(*store));
    return children(0);
  }
  std::optional<TextList> enabledAfterTheStep(const AccountDictionary& builder) {
    childrenAfterTheStep(builder);
    return texts(account(0).enabledDataclasses());
  }
};

AccountDictionary hostedChild(std::string_view identifier) {
  return anAccount(identifier, kVelmoraAccountType, "VelmoraAccount");
}

TEST_F(HostedChildrenStepTest, OnlyHostedServiceChildrenLoseTheirDisplayNames) {
  const AccountDictionary calendar = calendarChild().with(kAccountDisplayName, "Calendar");

  EXPECT_EQ(
      childrenAfterTheStep(cloudAccount().withChildren(
          {hostedChild("V").with(kAccountDisplayName, "Mail"), calendar,
           anAccount("W", kVelmoraAccountType, "MarrowAccount").with(kAccountDisplayName, "")})),
      (PropertyArray{hostedChild("V"), calendar,
                     anAccount("W", kVelmoraAccountType, "MarrowAccount")}));
}

TEST_F(HostedChildrenStepTest, ChildrenOfAnotherClassesAccountAreLeft) {
  const AccountDictionary child = hostedChild("V").with(kAccountDisplayName, "Mail");

  EXPECT_EQ(childrenAfterTheStep(
                anAccount("Q", kQuarxAccountType, "VelmoraAccount").withChildren({child})),
            PropertyArray{child});
}

TEST_F(HostedChildrenStepTest, EqualChildrenAllLoseTheirDisplayNames) {
  const AccountDictionary child = hostedChild("V").with(kAccountDisplayName, "Mail");

  EXPECT_EQ(childrenAfterTheStep(cloudAccount().withChildren({child, hostedChild("V"), child})),
            (PropertyArray{hostedChild("V"), hostedChild("V"), hostedChild("V")}));
}

TEST_F(HostedChildrenStepTest, ARenamedChildCarriesTheIdentifierThatItLacked) {
  const PropertyArray after = childrenAfterTheStep(cloudAccount().withChildren(
      {hostedChild("").without(kAccountIdentifier).with(kAccountDisplayName, "Mail")}));

  const PropertyDictionary child = *after.at(0).asDictionary();
  EXPECT_TRUE(child.textForKey(kAccountIdentifier));
  EXPECT_EQ(child.textForKey(kAccountSyncIdentifier), child.textForKey(kAccountIdentifier));
  EXPECT_FALSE(child.contains(kAccountDisplayName));
}

TEST_F(HostedChildrenStepTest, AChildWithoutADisplayNameIsNotTouched) {
  const AccountDictionary child = hostedChild("").without(kAccountIdentifier);

  EXPECT_EQ(childrenAfterTheStep(cloudAccount().withChildren({child})), PropertyArray{child});
}

TEST_F(HostedChildrenStepTest, ChildrenThatMakeNoRecordAreLeft) {
  const AccountDictionary unknownType =
      anAccount("X", "Unknown", "VelmoraAccount").with(kAccountDisplayName, "Mail");

  EXPECT_EQ(childrenAfterTheStep(cloudAccount().with(
                kAccountChildAccounts, PropertyArray{unknownType, "no dictionary", 5})),
            (PropertyArray{unknownType, "no dictionary", 5}));
}

TEST_F(HostedChildrenStepTest, ADisplayNameThatIsNoTextIsLeft) {
  const AccountDictionary child = hostedChild("V").with(kAccountDisplayName, 5);

  EXPECT_EQ(childrenAfterTheStep(cloudAccount().withChildren({child})), PropertyArray{child});
}

TEST_F(HostedChildrenStepTest, AnAbsentListOfChildrenStaysAbsent) {
  openStoreWith(
      {cloudAccount(),
       cloudAccount().with(kAccountIdentifier, "Z2").with(kAccountChildAccounts, "no array")});

  migrator._migrateAccountsFrom8C136(*store);

  EXPECT_FALSE(account(0).properties().contains(kAccountChildAccounts));
  EXPECT_EQ(*account(1).properties().find(kAccountChildAccounts), PropertyValue("no array"));
}

TEST_F(HostedChildrenStepTest, MailIsSwitchedOnForWebMailClasses) {
  for (const std::string_view accountClass :
       {"IMAPAccount", "GmailAccount", "YahooAccount", "AOLAccount", "POPAccount"}) {
    SCOPED_TRACE(accountClass);
    EXPECT_EQ(enabledAfterTheStep(anAccount("A", kMailAccountType, accountClass)),
              dataclasses({kAccountDataclassMail}));
    EXPECT_EQ(
        enabledAfterTheStep(anAccount("A", kMailAccountType, accountClass).with("IsActive", true)),
        dataclasses({kAccountDataclassMail}));
  }
}

TEST_F(HostedChildrenStepTest, AnInactiveWebMailAccountIsLeft) {
  EXPECT_EQ(
      enabledAfterTheStep(anAccount("A", kMailAccountType, "POPAccount").with("IsActive", false)),
      std::nullopt);
}

TEST_F(HostedChildrenStepTest, MailOfOtherClassesIsLeft) {
  EXPECT_EQ(enabledAfterTheStep(anAccount("A", kVelmoraAccountType, "VelmoraAccount")),
            std::nullopt);
  EXPECT_EQ(enabledAfterTheStep(anAccount("A", kTolvaneIMAPAccountType, "TolvaneIMAPAccount")),
            std::nullopt);
}

}  // namespace
}  // namespace accounts
