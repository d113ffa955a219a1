#include "tests/accountsettings/StoreFixture.h"

namespace accounts {
namespace {

class AccountsManagerMigrationSupport : public StoreFixture {
 protected:
  /// What the decision says: legacy mail, legacy Exchange, account settings, such as "1 0 0".
  static std::string decision() {
    bool mailAccounts = false;
    bool exchangeAccounts = false;
    bool accountSettings = false;
    AccountsManager::shouldMigrateOldMailAccounts_oldDAAccounts_newAccountSettings(
        &mailAccounts, &exchangeAccounts, &accountSettings);
    return std::to_string(mailAccounts) + " " + std::to_string(exchangeAccounts) + " " +
           std::to_string(accountSettings);
  }
  /// The decision's line with its three numbers.
  static std::string needsMigration(int mailAccounts, int exchangeAccounts, int accountSettings) {
    return "+[AccountsManager(MigrationSupport) "
           "shouldMigrateOldMailAccounts:oldDAAccounts:newAccountSettings:] (N) "
           "\"Accounts settings needs migration! oldMailAccountsPresent=" +
           std::to_string(mailAccounts) +
           ", oldDAAccountsPresent=" + std::to_string(exchangeAccounts) +
           ", migrateNewAccountsInfo=" + std::to_string(accountSettings) + "\"";
  }
  static std::string outOfDate(std::string_view savedVersion) {
    return "+[AccountsManager(MigrationSupport) accountSettingsNeedsToBeMigrated] (N) "
           "\"Account Settings Version out of date: savedVersion=" +
           std::string(savedVersion) + ", currentVersion=12\"";
  }
  const std::string missingVersion =
      "+[AccountsManager(MigrationSupport) accountSettingsNeedsToBeMigrated] (N) "
      "\"Account Settings plist is missing a version number, returning NO for migration\"";

  void addLegacyMail() { device.fileSystem.addFile(kLegacyMailPath, ""); }
  void addLegacyExchange() { device.fileSystem.addFile(kLegacyExchangePath, ""); }
};

TEST_F(AccountsManagerMigrationSupport, TheFilesStandWhereTheExportedFunctionsSay) {
  EXPECT_EQ(daAccountPath(), "/var/mobile/Library/Preferences/com.quarx.DataAccess.plist");
  EXPECT_EQ(mailAccountsPath(), "/var/mobile/Library/Mail/Accounts.plist");
  EXPECT_EQ(accountSettingsAccountsPath(), AccountsManager::fullPathToAccountSettingsPlist());
}

TEST_F(AccountsManagerMigrationSupport, TheCurrentVersionIsTwelve) {
  EXPECT_EQ(AccountsManager::currentVersion(), 12u);
}

TEST_F(AccountsManagerMigrationSupport,
       BothLegacyStoresLeaveOutdatedAccountSettingsOutOfTheDecision) {
  addLegacyMail();
  addLegacyExchange();
  writeSettings({}, 3);
  EXPECT_EQ(decision(), "1 1 0");
  EXPECT_EQ(takeLines(), Lines{needsMigration(1, 1, 0)});
}

TEST_F(AccountsManagerMigrationSupport, OneLegacyStoreIsEnough) {
  addLegacyExchange();
  writeSettings({}, 3);
  EXPECT_EQ(decision(), "0 1 0");
  EXPECT_EQ(takeLines(), Lines{needsMigration(0, 1, 0)});
}

TEST_F(AccountsManagerMigrationSupport, AnEmptyLegacyMailFileCountsAsPresent) {
  addLegacyMail();
  EXPECT_TRUE(AccountsManager::_oldMailAccountsInformationFound());
  EXPECT_FALSE(AccountsManager::_oldDAAccountsInformationFound());
  EXPECT_EQ(decision(), "1 0 0");
  EXPECT_EQ(takeLines(), Lines{needsMigration(1, 0, 0)});
}

TEST_F(AccountsManagerMigrationSupport, TheVersionIsNotEvenReadWhenThereIsALegacyStore) {
  addLegacyMail();
  writeSettings({}, 3);
  decision();
  EXPECT_EQ(device.journal,
            (std::vector<std::string>{"exists " + std::string(kLegacyMailPath),
                                      "exists " + std::string(kLegacyExchangePath)}));
}

TEST_F(AccountsManagerMigrationSupport, CurrentAccountSettingsNeedNothing) {
  writeSettings({}, 12);
  EXPECT_EQ(decision(), "0 0 0");
  EXPECT_EQ(takeLines(), Lines{});
}

TEST_F(AccountsManagerMigrationSupport, AccountSettingsOfALaterVersionNeedNothing) {
  writeSettings({}, 13);
  EXPECT_EQ(decision(), "0 0 0");
  EXPECT_EQ(takeLines(), Lines{});
}

TEST_F(AccountsManagerMigrationSupport, OutdatedAccountSettingsNeedMigration) {
  writeSettings({}, 11);
  EXPECT_EQ(decision(), "0 0 1");
  EXPECT_EQ(takeLines(), (Lines{outOfDate("11"), needsMigration(0, 0, 1)}));
}

TEST_F(AccountsManagerMigrationSupport, AccountSettingsWithoutAVersionNeedNothingButALine) {
  device.addPropertyList(kSettingsPath, PropertyDictionary{{"Accounts", PropertyArray{}}});
  EXPECT_EQ(decision(), "0 0 0");
  EXPECT_EQ(takeLines(), Lines{missingVersion});
}

TEST_F(AccountsManagerMigrationSupport, AVersionThatIsNoNumberCountsAsMissing) {
  for (const PropertyValue& version :
       {PropertyValue(PropertyArray{3}), PropertyValue(PropertyDictionary{{"a", 3}}),
        PropertyValue(PropertyData("3")), PropertyValue(PropertyDate{3})}) {
    writeSettings({}, version);
    EXPECT_FALSE(AccountsManager::accountSettingsNeedsToBeMigrated());
    EXPECT_EQ(takeLines(), Lines{missingVersion});
  }
}

TEST_F(AccountsManagerMigrationSupport, AVersionThatReadsAsANumberIsOne) {
  for (const PropertyValue& version :
       {PropertyValue("3"), PropertyValue(3.9), PropertyValue(" 3rd")}) {
    writeSettings({}, version);
    EXPECT_TRUE(AccountsManager::accountSettingsNeedsToBeMigrated());
    EXPECT_EQ(takeLines(), Lines{outOfDate("3")});
  }
}

TEST_F(AccountsManagerMigrationSupport, ATextWithoutANumberIsVersionZero) {
  writeSettings({}, "twelve");
  EXPECT_TRUE(AccountsManager::accountSettingsNeedsToBeMigrated());
  EXPECT_EQ(takeLines(), Lines{outOfDate("0")});
}

TEST_F(AccountsManagerMigrationSupport, ANegativeVersionCountsAsNewer) {
  writeSettings({}, -1);
  EXPECT_EQ(decision(), "0 0 0");
  EXPECT_EQ(takeLines(), Lines{});
}

TEST_F(AccountsManagerMigrationSupport, AVersionBeyondTheSignedRangeCountsAsNewer) {
  writeSettings({}, ~std::uint64_t{0});
  EXPECT_FALSE(AccountsManager::accountSettingsNeedsToBeMigrated());
}

TEST_F(AccountsManagerMigrationSupport, WithoutAnyFileNothingNeedsMigration) {
  EXPECT_EQ(decision(), "0 0 0");
  EXPECT_EQ(takeLines(), Lines{});
}

TEST_F(AccountsManagerMigrationSupport, AnUnreadableFileNeedsNothing) {
  device.fileSystem.addFile(kSettingsPath, "no property list");
  EXPECT_EQ(decision(), "0 0 0");
  EXPECT_EQ(takeLines(), Lines{});
}

TEST_F(AccountsManagerMigrationSupport, EveryReferenceOfTheDecisionIsRequired) {
  bool flag = false;
  const auto decide =
      AccountsManager::shouldMigrateOldMailAccounts_oldDAAccounts_newAccountSettings;
  EXPECT_DEATH(decide(nullptr, nullptr, nullptr), "migrateOldMailAccounts cannot be nil");
  EXPECT_DEATH(decide(&flag, nullptr, nullptr), "migrateOldDAAccounts cannot be nil");
  EXPECT_DEATH(decide(&flag, &flag, nullptr), "migrateNewAccounts cannot be nil");
}

TEST_F(AccountsManagerMigrationSupport, TheAccountSettingsFileIsRemoved) {
  writeSettings({mail("A")});
  AccountsManager::removeNewAccountSettingsToMigrateOldAccountInformation();
  EXPECT_EQ(device.fileSystem.contentsOf(kSettingsPath), std::nullopt);
  EXPECT_EQ(takeLines(), Lines{});
}

TEST_F(AccountsManagerMigrationSupport, WithoutAFileThereIsNothingToRemove) {
  AccountsManager::removeNewAccountSettingsToMigrateOldAccountInformation();
  EXPECT_EQ(device.journal, std::vector<std::string>{"exists " + std::string(kSettingsPath)});
  EXPECT_EQ(takeLines(), Lines{});
}

TEST_F(AccountsManagerMigrationSupport, AFileThatCannotBeRemovedIsLogged) {
  writeSettings({mail("A")});
  device.fileSystem.failWhenLineBegins("remove");
  AccountsManager::removeNewAccountSettingsToMigrateOldAccountInformation();
  const std::string path(kSettingsPath);
  EXPECT_EQ(takeLines(), Lines{"+[AccountsManager(MigrationSupport) "
                               "removeNewAccountSettingsToMigrateOldAccountInformation] (N) "
                               "\"Could not remove " +
                               path + ". Error remove " + path + ": Input/output error\""});
}

TEST_F(AccountsManagerMigrationSupport, TheLockIsHeldUntilItIsReleased) {
  std::unique_ptr<NamedLock> lock = AccountsManager::createAndLockMigrationLock();
  ASSERT_NE(lock, nullptr);
  EXPECT_EQ(device.journal, std::vector<std::string>{"lock AccountMigrationInProgress"});
  AccountsManager::releaseMigrationLock(std::move(lock));
  EXPECT_EQ(device.journal.back(), "unlock AccountMigrationInProgress");
}

TEST_F(AccountsManagerMigrationSupport, WaitingTakesTheLockAndGivesItBackAtOnce) {
  AccountsManager::waitForMigrationToFinish();
  EXPECT_EQ(device.journal, (std::vector<std::string>{"lock AccountMigrationInProgress",
                                                      "unlock AccountMigrationInProgress"}));
}

TEST_F(AccountsManagerMigrationSupport, WithoutALockObjectThereIsNothingToReleaseOrToWaitFor) {
  device.sharedResources.canMakeLock = false;
  EXPECT_EQ(AccountsManager::createAndLockMigrationLock(), nullptr);
  AccountsManager::releaseMigrationLock(nullptr);
  AccountsManager::waitForMigrationToFinish();
  EXPECT_EQ(device.journal, std::vector<std::string>{});
}

}  // namespace
}  // namespace accounts
