#include "tests/migrator/MigratorFixture.h"

// The step of 9A334: secondary accounts and provisioning.

namespace accounts {
namespace {

class CloudProvisioningStepTest : public StepTest {
 protected:
  static AccountDictionary cloudAccount() { return anAccount("Z", kQuarxAccountType, "ZQAccount"); }
  void runStepOn(PropertyArray accounts) {
    openStoreWith(std::move(accounts));
    EXPECT_TRUE(migrator._migrateAccountsFrom9A334(*store));
  }
  std::optional<TextList> storedProvisioned(std::size_t position) {
    return texts(account(position).properties().arrayForKey(kAccountProvisionedDataclasses));
  }
};

const std::string fixingLine =
    "AccountsDataMigrator: Fixing secondary account with ubiquity and keyvalue enabled";
const std::string statusLine =
    "AccountsDataMigrator: Found Velmora mail as Stratix child account, setting status to 1";
const std::string provisioningLine = "AccountsDataMigrator: Enabling provisioning for dataclass ";

AccountDictionary hostedChild() {
  return anAccount("V", kVelmoraAccountType, "VelmoraAccount");
}

TEST_F(CloudProvisioningStepTest, ASecondaryAccountLosesCloudDocumentsAndKeyValueStorage) {
  runStepOn({anAccount("V", kVelmoraAccountType, "VelmoraAccount")
                 .enabledFor({kAccountDataclassMail, kAccountDataclassKeyValue})});

  EXPECT_EQ(storedEnabled(0), dataclasses({kAccountDataclassMail}));
  EXPECT_EQ(console(), Lines{fixingLine});
}

TEST_F(CloudProvisioningStepTest, UbiquityAloneIsReasonEnough) {
  runStepOn({cloudAccount().with("primaryAccount", false).enabledFor({kAccountDataclassUbiquity})});

  EXPECT_EQ(storedEnabled(0), dataclasses({}));
  EXPECT_EQ(console(), Lines{fixingLine});
}

TEST_F(CloudProvisioningStepTest, ThePrimaryAccountKeepsThem) {
  const AccountDictionary primary =
      cloudAccount()
          .with("primaryAccount", true)
          .enabledFor({kAccountDataclassUbiquity, kAccountDataclassKeyValue});

  runStepOn({primary});

  EXPECT_EQ(account(0).properties(), PropertyDictionary(primary));
  EXPECT_TRUE(console().empty());
}

TEST_F(CloudProvisioningStepTest, ASecondaryAccountWithoutThemIsLeft) {
  const AccountDictionary secondary = cloudAccount().enabledFor({kAccountDataclassMail});

  runStepOn({secondary});

  EXPECT_EQ(account(0).properties(), PropertyDictionary(secondary));
  EXPECT_TRUE(console().empty());
}

TEST_F(CloudProvisioningStepTest, ThePrimaryFlagIsReadUnderItsOwnText) {
  device.cloudAccountService.primaryAccount = "first";

  runStepOn({cloudAccount().with("first", true).enabledFor({kAccountDataclassUbiquity})});

  EXPECT_EQ(console(), Lines{fixingLine});
}

TEST_F(CloudProvisioningStepTest, HostedServiceMailAmongTheChildrenSetsStatus2To1) {
  runStepOn({cloudAccount().with("status", 2).withChildren({hostedChild()})});

  EXPECT_EQ(*account(0).properties().find("status"), PropertyValue(1));
  EXPECT_EQ(console(), Lines{statusLine});
}

TEST_F(CloudProvisioningStepTest, AnotherStatusStays) {
  runStepOn({cloudAccount().with("status", 3).withChildren({hostedChild()})});

  EXPECT_EQ(*account(0).properties().find("status"), PropertyValue(3));
}

TEST_F(CloudProvisioningStepTest, Status2WithoutHostedServiceMailStays) {
  runStepOn({cloudAccount().with("status", 2).withChildren({calendarChild()})});

  EXPECT_EQ(*account(0).properties().find("status"), PropertyValue(2));
}

TEST_F(CloudProvisioningStepTest, ProvisioningFollowsTheChildren) {
  runStepOn({cloudAccount()
                 .provisionedFor({kAccountDataclassBookmarks})
                 .withChildren({calendarChild(), hostedChild()})});

  EXPECT_EQ(storedProvisioned(0), dataclasses({kAccountDataclassMail, kAccountDataclassBookmarks,
                                               kAccountDataclassCalendars}));
  EXPECT_EQ(console(), (Lines{provisioningLine + "com.quarx.Dataclass.Mail",
                              provisioningLine + "com.quarx.Dataclass.Calendars"}));
}

TEST_F(CloudProvisioningStepTest, ACalendarChildProvisionsCalendars) {
  runStepOn(
      {cloudAccount().provisionedFor({kAccountDataclassMail}).withChildren({calendarChild()})});

  EXPECT_EQ(storedProvisioned(0), dataclasses({kAccountDataclassMail, kAccountDataclassCalendars}));
  EXPECT_EQ(console(), Lines{provisioningLine + "com.quarx.Dataclass.Calendars"});
}

TEST_F(CloudProvisioningStepTest, WhatIsProvisionedAlreadyIsLeft) {
  const AccountDictionary before = cloudAccount()
                                       .provisionedFor({kAccountDataclassCalendars, "unknown"})
                                       .withChildren({calendarChild()});

  runStepOn({before});

  EXPECT_EQ(account(0).properties(), PropertyDictionary(before));
  EXPECT_TRUE(console().empty());
}

TEST_F(CloudProvisioningStepTest, WithoutChildrenNothingIsProvisioned) {
  const AccountDictionary before = cloudAccount().provisionedFor({});

  runStepOn({before});

  EXPECT_EQ(account(0).properties(), PropertyDictionary(before));
}

TEST_F(CloudProvisioningStepTest, AnotherClassIsNotProvisioned) {
  const AccountDictionary before = anAccount("Q", kQuarxAccountType, "VelmoraAccount")
                                       .with("status", 2)
                                       .provisionedFor({})
                                       .withChildren({calendarChild(), hostedChild()});

  runStepOn({before});

  EXPECT_EQ(account(0).properties(), PropertyDictionary(before));
}

TEST_F(CloudProvisioningStepTest, AccountsOfOtherTypesAreLeft) {
  const AccountDictionary before = anAccount("E", kExchangeAccountType, "ZQAccount")
                                       .with("status", 2)
                                       .provisionedFor({})
                                       .withChildren({calendarChild(), hostedChild()});

  runStepOn({before});

  EXPECT_EQ(account(0).properties(), PropertyDictionary(before));
}

TEST_F(CloudProvisioningStepTest, ChildrenAreKnownByTheExactTextOfTheirTypes) {
  const BasicAccountReference parent = BasicAccount::initWithProperties(cloudAccount().with(
      kAccountChildAccounts,
      PropertyArray{"no dictionary", PropertyDictionary{{kAccountType, "CalDAV"}},
                    PropertyDictionary{{kAccountType, 5}}}));

  EXPECT_TRUE(Migrator::_account_hasChildAccountOfType(*parent, "CalDAV"));
  EXPECT_FALSE(Migrator::_account_hasChildAccountOfType(*parent, "caldav"));
  EXPECT_FALSE(Migrator::_account_hasChildAccountOfType(*parent, "Velmora"));
}

TEST_F(CloudProvisioningStepTest, AnAccountWithoutChildrenHasNoneOfAnyType) {
  const BasicAccountReference parent = BasicAccount::initWithProperties(cloudAccount());

  EXPECT_FALSE(AccountsDataMigrator::_account_hasChildAccountOfType(*parent, "CalDAV"));
}

}  // namespace
}  // namespace accounts
