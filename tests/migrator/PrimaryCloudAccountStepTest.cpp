#include "tests/migrator/MigratorFixture.h"

// The step of 9A182: reminders and the primary cloud account.

namespace accounts {
namespace {

class PrimaryCloudAccountStepTest : public StepTest {
 protected:
  static AccountDictionary cloudAccount(std::string_view identifier, std::int64_t status) {
    return anAccount(identifier, kQuarxAccountType, "ZQAccount").with("status", status);
  }
  void runStepOn(PropertyArray accounts) {
    openStoreWith(std::move(accounts));
    EXPECT_TRUE(migrator._migrateAccountsFrom9A182(*store));
  }
  bool isPrimary(std::size_t position) {
    return account(position).properties().contains("primaryAccount");
  }
};

const std::string foundLine = "Found Velmora account with status 2";
const std::string revertingLine = "Standard Velmora account with status 2, reverting to status 1";

TEST_F(PrimaryCloudAccountStepTest, RemindersFollowCalendars) {
  runStepOn({anAccount("C", kCalDAVAccountType, "MobileCalDAVAccount")
                 .enabledFor({kAccountDataclassCalendars})});

  EXPECT_EQ(texts(account(0).enabledDataclasses()),
            dataclasses({kAccountDataclassCalendars, kAccountDataclassReminders}));
}

TEST_F(PrimaryCloudAccountStepTest, WithoutCalendarsThereAreNoReminders) {
  runStepOn({anAccount("C", kCalDAVAccountType, "MobileCalDAVAccount").enabledFor({})});

  EXPECT_EQ(storedEnabled(0), dataclasses({}));
}

TEST_F(PrimaryCloudAccountStepTest, ATypeWithoutRemindersGetsNone) {
  runStepOn(
      {anAccount("G", kGmailAccountType, "GmailAccount").enabledFor({kAccountDataclassCalendars})});

  EXPECT_EQ(storedEnabled(0), dataclasses({kAccountDataclassCalendars}));
}

TEST_F(PrimaryCloudAccountStepTest, ChildAccountsAreWalkedToo) {
  runStepOn(
      {anAccount("Q", kQuarxAccountType, "Other")
           .withChildren({anAccount("Z", kQuarxAccountType, "ZQAccount").with("status", 2)})});

  EXPECT_EQ(console(), (Lines{foundLine, revertingLine}));
}

TEST_F(PrimaryCloudAccountStepTest, ACloudAccountOfAnyOtherStatusLosesReminders) {
  for (const std::int64_t status : {0, 1, 3}) {
    SCOPED_TRACE(status);
    runStepOn({cloudAccount("Z", status)
                   .enabledFor({kAccountDataclassCalendars, kAccountDataclassReminders})});

    EXPECT_EQ(storedEnabled(0), dataclasses({kAccountDataclassCalendars}));
  }
  EXPECT_TRUE(console().empty());
}

TEST_F(PrimaryCloudAccountStepTest, ACloudAccountWithoutAStatusLosesReminders) {
  runStepOn(
      {anAccount("Z", kQuarxAccountType, "ZQAccount").enabledFor({kAccountDataclassCalendars})});

  EXPECT_EQ(storedEnabled(0), dataclasses({kAccountDataclassCalendars}));
}

TEST_F(PrimaryCloudAccountStepTest, AnotherClassKeepsReminders) {
  runStepOn({anAccount("Q", kQuarxAccountType, "VelmoraAccount")
                 .enabledFor({kAccountDataclassReminders})});

  EXPECT_EQ(storedEnabled(0), dataclasses({kAccountDataclassReminders}));
}

TEST_F(PrimaryCloudAccountStepTest, AnAccountOfStatus2WithChildrenRevertsToStatus1AndNothingElse) {
  const AccountDictionary before =
      cloudAccount("Z", 2)
          .with(kAccountDisplayName, "Velmora")
          .with(kAccountTypeString, "Velmora")
          .enabledFor({kAccountDataclassDeviceLocator})
          .withChildren({anAccount("K", kCalDAVAccountType, "MobileCalDAVAccount")});

  runStepOn({before});

  EXPECT_EQ(account(0).properties(), AccountDictionary(before).with("status", 1));
  EXPECT_EQ(console(), (Lines{foundLine, revertingLine}));
}

TEST_F(PrimaryCloudAccountStepTest, AChildThatMakesNoRecordIsStillAChild) {
  runStepOn({cloudAccount("Z", 2).with(kAccountChildAccounts, PropertyArray{"no dictionary"})});

  EXPECT_EQ(*account(0).properties().find("status"), PropertyValue(1));
}

TEST_F(PrimaryCloudAccountStepTest, AnEmptyListOfChildrenIsNoChildren) {
  runStepOn({cloudAccount("Z", 2).with(kAccountChildAccounts, PropertyArray())});

  EXPECT_EQ(*account(0).properties().find("status"), PropertyValue(2));
  EXPECT_EQ(console(), Lines{foundLine});
}

TEST_F(PrimaryCloudAccountStepTest, AnAccountOfStatus2WithTheDeviceLocatorBecomesPrimary) {
  runStepOn({cloudAccount("Z", 2)
                 .with(kAccountDisplayName, "Velmora")
                 .enabledFor({kAccountDataclassDeviceLocator})});

  EXPECT_EQ(account(0).properties(),
            cloudAccount("Z", 2)
                .with(kAccountDisplayName, "Stratix")
                .with(kAccountTypeString, "Stratix")
                .with(kAccountShortTypeString, "Stratix")
                .with("primaryAccount", true)
                .enabledFor({kAccountDataclassDeviceLocator, kAccountDataclassUbiquity,
                             kAccountDataclassKeyValue}));
  EXPECT_EQ(console(), Lines{foundLine});
}

TEST_F(PrimaryCloudAccountStepTest, ADisplayNameOfTheUsersOwnIsKept) {
  runStepOn({cloudAccount("Z", 2).with(kAccountDisplayName, "My mail")});

  EXPECT_EQ(account(0).displayName(), "My mail");
  EXPECT_EQ(account(0).typeString(), "Stratix");
}

TEST_F(PrimaryCloudAccountStepTest, APrimaryFoundInTheWalkEndsTheSearch) {
  runStepOn(
      {cloudAccount("Z1", 2), cloudAccount("Z2", 2).enabledFor({kAccountDataclassDeviceLocator})});

  EXPECT_FALSE(isPrimary(0));
  EXPECT_TRUE(isPrimary(1));
}

TEST_F(PrimaryCloudAccountStepTest, ALaterAccountDoesNotUndoAFoundPrimary) {
  runStepOn({cloudAccount("Z1", 2),
             cloudAccount("Z2", 2).enabledFor({kAccountDataclassDeviceLocator}),
             cloudAccount("Z3", 2)});

  EXPECT_FALSE(isPrimary(0));
  EXPECT_TRUE(isPrimary(1));
  EXPECT_FALSE(isPrimary(2));
}

TEST_F(PrimaryCloudAccountStepTest, AnAccountThatRevertsIsNoPrimaryThatWasFound) {
  runStepOn({cloudAccount("Z1", 2)
                 .enabledFor({kAccountDataclassDeviceLocator})
                 .withChildren({calendarChild()}),
             cloudAccount("Z2", 2)});

  EXPECT_FALSE(isPrimary(0));
  EXPECT_TRUE(isPrimary(1));
}

TEST_F(PrimaryCloudAccountStepTest, AnAccountOfAnotherTypeDoesNotBecomePrimaryByTheSearch) {
  runStepOn({anAccount("V", kVelmoraAccountType, "VelmoraAccount").with("status", 2),
             anAccount("E", kExchangeAccountType, "ZQAccount").with("status", 2)});

  EXPECT_FALSE(isPrimary(0));
  EXPECT_FALSE(isPrimary(1));
}

TEST_F(PrimaryCloudAccountStepTest, AnAccountOfAnotherClassMayBecomePrimaryByTheSearch) {
  runStepOn({anAccount("Q", kQuarxAccountType, "VelmoraAccount").with("status", 2)});

  EXPECT_TRUE(isPrimary(0));
}

TEST_F(PrimaryCloudAccountStepTest, WithoutADeviceLocatorTheFirstAccountOfStatus2BecomesPrimary) {
  runStepOn({cloudAccount("Z1", 1), cloudAccount("Z2", 2), cloudAccount("Z3", 2)});

  EXPECT_FALSE(isPrimary(0));
  EXPECT_EQ(*account(1).properties().find("primaryAccount"), PropertyValue(true));
  EXPECT_EQ(storedEnabled(1), dataclasses({kAccountDataclassUbiquity, kAccountDataclassKeyValue}));
  EXPECT_FALSE(isPrimary(2));
}

TEST_F(PrimaryCloudAccountStepTest, WithoutAnAccountOfStatus2NoneBecomesPrimary) {
  runStepOn({cloudAccount("Z1", 1), cloudAccount("Z2", 0)});

  EXPECT_FALSE(isPrimary(0));
  EXPECT_FALSE(isPrimary(1));
}

TEST_F(PrimaryCloudAccountStepTest, TheStatusIsReadAsAnInteger) {
  runStepOn({anAccount("Z", kQuarxAccountType, "ZQAccount").with("status", "2 or so")});

  EXPECT_EQ(console(), Lines{foundLine});
}

TEST_F(PrimaryCloudAccountStepTest, TheKeysAreTheCloudAccountServices) {
  device.cloudAccountService.status = "state";
  device.cloudAccountService.primaryAccount = "first";
  device.cloudAccountService.displayName = "Cloud";

  runStepOn({anAccount("Z", kQuarxAccountType, "ZQAccount").with("state", 2)});

  EXPECT_EQ(*account(0).properties().find("first"), PropertyValue(true));
  EXPECT_EQ(account(0).typeString(), "Cloud");
}

}  // namespace
}  // namespace accounts
