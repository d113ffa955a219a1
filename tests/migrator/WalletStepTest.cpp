#include "tests/migrator/MigratorFixture.h"

// The step of 9B176: wallet and cloud tabs.

namespace accounts {
namespace {

class WalletStepTest : public StepTest {
 protected:
  static AccountDictionary primaryAccount() {
    return anAccount("Z", kQuarxAccountType, "ZQAccount").with("primaryAccount", true);
  }
  void runStepOn(PropertyArray accounts) {
    openStoreWith(std::move(accounts));
    EXPECT_TRUE(migrator._migrateAccountsFrom9B176(*store));
  }
  std::optional<TextList> storedProvisioned() {
    return texts(account(0).properties().arrayForKey(kAccountProvisionedDataclasses));
  }
};

const std::string shoeboxLine =
    "AccountsDataMigrator: Provisioning Shoebox data class in primary account";
const std::string enablingLine =
    "AccountsDataMigrator: Enabling Shoebox data class in primary account";

TEST_F(WalletStepTest, TheWalletFollowsCloudDocuments) {
  runStepOn({primaryAccount()
                 .provisionedFor({kAccountDataclassUbiquity})
                 .enabledFor({kAccountDataclassUbiquity})});

  EXPECT_EQ(storedProvisioned(),
            dataclasses({kAccountDataclassUbiquity, kAccountDataclassShoebox}));
  EXPECT_EQ(storedEnabled(0), dataclasses({kAccountDataclassUbiquity, kAccountDataclassShoebox}));
  EXPECT_EQ(console(), (Lines{shoeboxLine, enablingLine}));
}

TEST_F(WalletStepTest, TheWalletFollowsCloudDocumentsWhateverTheClass) {
  runStepOn({anAccount("Q", kQuarxAccountType, "VelmoraAccount")
                 .with("primaryAccount", true)
                 .provisionedFor({kAccountDataclassUbiquity})});

  EXPECT_EQ(storedProvisioned(),
            dataclasses({kAccountDataclassUbiquity, kAccountDataclassShoebox}));
}

TEST_F(WalletStepTest, CloudDocumentsThatAreOffLeaveTheWalletOff) {
  runStepOn({primaryAccount().provisionedFor({kAccountDataclassUbiquity})});

  EXPECT_EQ(storedProvisioned(),
            dataclasses({kAccountDataclassUbiquity, kAccountDataclassShoebox}));
  EXPECT_EQ(storedEnabled(0), std::nullopt);
  EXPECT_EQ(console(), Lines{shoeboxLine});
}

TEST_F(WalletStepTest, AWalletThatIsProvisionedIsOnlyEnabled) {
  runStepOn({primaryAccount().enabledFor({kAccountDataclassUbiquity})});

  EXPECT_EQ(storedProvisioned(), std::nullopt);
  EXPECT_EQ(storedEnabled(0), dataclasses({kAccountDataclassUbiquity, kAccountDataclassShoebox}));
  EXPECT_EQ(console(), Lines{enablingLine});
}

TEST_F(WalletStepTest, WithoutCloudDocumentsTheWalletIsNeitherProvisionedNorEnabled) {
  const AccountDictionary before = primaryAccount()
                                       .provisionedFor({kAccountDataclassMail})
                                       .enabledFor({kAccountDataclassUbiquity});

  runStepOn({before});

  EXPECT_EQ(account(0).properties(), PropertyDictionary(before));
  EXPECT_TRUE(console().empty());
}

TEST_F(WalletStepTest, ASecondaryAccountIsLeft) {
  const AccountDictionary before = primaryAccount()
                                       .with("primaryAccount", false)
                                       .provisionedFor({kAccountDataclassUbiquity})
                                       .enabledFor({kAccountDataclassUbiquity});

  runStepOn({before});

  EXPECT_EQ(account(0).properties(), PropertyDictionary(before));
  EXPECT_TRUE(console().empty());
}

TEST_F(WalletStepTest, TheEnablingLineIsWrittenAlsoWhenTheTypeDoesNotSupportTheWallet) {
  device.bundleResources.replaced["AccountTypesProperties"] = PropertyDictionary{
      {kQuarxAccountType, PropertyDictionary{{kPropertiesSupportedDataclasses,
                                              PropertyArray{kAccountDataclassUbiquity}}}}};

  runStepOn({primaryAccount().enabledFor({kAccountDataclassUbiquity})});

  EXPECT_EQ(storedEnabled(0), dataclasses({kAccountDataclassUbiquity}));
  EXPECT_EQ(console(), (Lines{shoeboxLine, enablingLine}));
}

TEST_F(WalletStepTest, EachAccountWithBookmarksAnnouncesCloudTabs) {
  runStepOn(
      {anAccount("Q", kQuarxAccountType, "ZQAccount").enabledFor({kAccountDataclassBookmarks}),
       anAccount("V", kVelmoraAccountType, "VelmoraAccount")
           .enabledFor({kAccountDataclassBookmarks})});

  EXPECT_EQ(device.cloudTabService.announcements,
            (std::vector<CloudTabs>{CloudTabs::On, CloudTabs::On}));
}

TEST_F(WalletStepTest, WithoutBookmarksNothingIsAnnounced) {
  runStepOn({anAccount("Q", kQuarxAccountType, "ZQAccount").enabledFor({kAccountDataclassMail}),
             anAccount("V", kVelmoraAccountType, "VelmoraAccount"),
             anAccount("B", kBookmarkDAVAccountType, "BookmarkAccount")
                 .enabledFor({kAccountDataclassBookmarks})});

  EXPECT_TRUE(device.cloudTabService.announcements.empty());
}

}  // namespace
}  // namespace accounts
