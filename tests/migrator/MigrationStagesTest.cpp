#include "tests/migrator/MigratorFixture.h"

namespace accounts {
namespace {

class MigrationStagesTest : public MigratorTest {
 protected:
  void addLegacyMailAccounts() {
    device.addPropertyList(kLegacyMailPath,
                           PropertyDictionary{{"MailAccounts", PropertyArray{PropertyDictionary{
                                                                   {"AccountType", "IMAPAccount"},
                                                                   {"uniqueId", "M"}}}}});
  }
  void addLegacyExchangeAccounts() {
    device.addPropertyList(
        kLegacyExchangePath,
        PropertyDictionary{{"DAAccountsKey", PropertyArray{PropertyDictionary{
                                                 {"DAAccountConfigurationClass", "ASAccount"},
                                                 {"DAAccountConfigurationAccountID", "E"}}}}});
  }
  void addBrokenLegacyExchangeAccounts() {
    device.addPropertyList(
        kLegacyExchangePath,
        PropertyDictionary{{"DAAccountsKey", PropertyArray{PropertyDictionary{}}}});
  }
  /// What changed the device or spoke to others, in order.
  Lines visibleStages() const {
    Lines stages;
    for (const std::string& line : device.journal) {
      const bool isQuestion = line.starts_with("exists ") || line.starts_with("isDirectory ") ||
                              line.starts_with("read ");
      if (!isQuestion) {
        stages.push_back(line);
      }
    }
    return stages;
  }
  TextList savedIdentifiers() const {
    TextList result;
    const PropertyArray saved = *settingsFile()->arrayForKey(kPlistAccountsKey);
    for (const PropertyValue& each : saved) {
      result.push_back(each.asDictionary()->textForKey(kAccountIdentifier)->string());
    }
    return result;
  }
};

const std::string settings(kSettingsPath);
const std::string autoFetchFile = "/var/mobile/Library/Mail/AutoFetchEnabled";

TEST_F(MigrationStagesTest, TheStagesComeInTheirOrder) {
  addLegacyMailAccounts();
  addLegacyExchangeAccounts();
  addSettingsFile(12, {});
  switchMigrationInformationOn();

  EXPECT_TRUE(migrator.executeMigrationSteps());

  const std::string information = "/var/mobile/Library/Logs/CrashReporter/AccountMigration";
  EXPECT_EQ(
      visibleStages(),
      (Lines{"copy " + settings + " -> " + copyAside, "console Migrating accounts",
             "remove " + std::string(kLegacyExchangePath) + ".original",
             "remove " + std::string(kLegacyMailPath) + ".original", "makeTemporary",
             "write /var/mobile/tmp/temporary-0", "setOwner /var/mobile/tmp/temporary-0",
             "rename /var/mobile/tmp/temporary-0 -> " + settings,
             "create " + std::string(kSentinelPath), "remove " + std::string(kLegacyExchangePath),
             "remove " + std::string(kLegacyMailPath), "remove " + std::string(kSentinelPath),
             "console Saving collated migration information", "createDirectory " + information,
             "writeAtomically " + information + "/AccountMigrationInformation-2012-9-19-17-9-4.txt",
             "remove " + autoFetchFile, "announceChange com.quarx.mobilemail MailAccounts"}));
}

TEST_F(MigrationStagesTest, NotificationsAreOffBeforeTheFirstFileIsTouchedAndOnAtTheEnd) {
  ASSERT_FALSE(device.process.shouldSkipNotifications);
  device.fileSystem.stopBefore(0);
  EXPECT_THROW(migrator.executeMigrationSteps(), WorldStopped);
  EXPECT_TRUE(device.process.shouldSkipNotifications);

  device.fileSystem.removeFaults();
  EXPECT_TRUE(AccountsDataMigrator().executeMigrationSteps());
  EXPECT_FALSE(device.process.shouldSkipNotifications);
}

TEST_F(MigrationStagesTest, WithNothingToMigrateTheStoreIsStillSavedAndTheMailApplicationTold) {
  addSettingsFile(12, {anAccount("A", kMailAccountType, "IMAPAccount")});
  device.fileSystem.addFile(autoFetchFile, "");

  EXPECT_TRUE(migrator.executeMigrationSteps());

  EXPECT_TRUE(console().empty());
  EXPECT_EQ(saves(), 1);
  EXPECT_EQ(settingsFile()->find(kPlistVersionKey)->integerValue(), 12);
  EXPECT_EQ(savedIdentifiers(), TextList{"A"});
  EXPECT_FALSE(exists(autoFetchFile));
  EXPECT_EQ(visibleStages().back(), "announceChange com.quarx.mobilemail MailAccounts");
  EXPECT_FALSE(migrator.collatedMigrationData());
}

TEST_F(MigrationStagesTest, WithNothingToMigrateNoLegacyStoreIsRemoved) {
  addSettingsFile(12, {});

  migrator.executeMigrationSteps();

  for (const std::string& stage : visibleStages()) {
    EXPECT_FALSE(stage.starts_with("create ")) << stage;
    EXPECT_FALSE(stage.ends_with("com.quarx.DataAccess.plist")) << stage;
  }
}

TEST_F(MigrationStagesTest, AnInterruptedRemovalIsFinishedAndNothingElseIsDone) {
  addLegacyMailAccounts();
  addLegacyExchangeAccounts();
  addSettingsFile(11, {});
  device.fileSystem.addFile(kSentinelPath, "");

  EXPECT_TRUE(migrator.executeMigrationSteps());

  EXPECT_EQ(
      visibleStages(),
      (Lines{"copy " + settings + " -> " + copyAside,
             "console Detected that a removal old accounts info was in progress. Early "
             "return!.",
             "remove " + std::string(kLegacyExchangePath), "remove " + std::string(kLegacyMailPath),
             "remove " + std::string(kSentinelPath)}));
  EXPECT_EQ(settingsFile()->find(kPlistVersionKey)->integerValue(), 11);
}

TEST_F(MigrationStagesTest, AfterAnInterruptedRemovalNotificationsStayOff) {
  device.fileSystem.addFile(kSentinelPath, "");

  ASSERT_FALSE(device.process.shouldSkipNotifications);

  migrator.executeMigrationSteps();

  EXPECT_TRUE(device.process.shouldSkipNotifications);
}

TEST_F(MigrationStagesTest, TheChainRunsAlsoWhenOnlyLegacyMailAccountsAreThere) {
  addLegacyMailAccounts();

  EXPECT_TRUE(migrator.executeMigrationSteps());

  EXPECT_EQ(console(), (Lines{"Error trying to save an accountsettings plist copy: " + settings +
                                  ": No such file or directory",
                              "Migrating accounts"}));
  // The step of 7A153 added the on-device account.
  EXPECT_EQ(savedIdentifiers(), (TextList{"M", "DeviceLocalAccount"}));
  // That of 7A242 switched mail and notes on.
  const PropertyArray saved = *settingsFile()->arrayForKey(kPlistAccountsKey);
  EXPECT_EQ(texts(saved.at(0).asDictionary()->arrayForKey(kAccountEnabledDataclasses)),
            dataclasses({kAccountDataclassMail, kAccountDataclassNotes}));
  EXPECT_FALSE(exists(kLegacyMailPath));
}

TEST_F(MigrationStagesTest, TheConversionsRunInTheOrderExchangeThenMail) {
  addLegacyMailAccounts();
  addLegacyExchangeAccounts();
  addSettingsFile(12, {});

  migrator.executeMigrationSteps();

  EXPECT_EQ(savedIdentifiers(), (TextList{"E", "M"}));
}

TEST_F(MigrationStagesTest, AFailedConversionIsNotTheMigrationsResult) {
  addBrokenLegacyExchangeAccounts();
  addSettingsFile(12, {});

  EXPECT_TRUE(migrator.executeMigrationSteps());

  EXPECT_EQ(console(),
            (Lines{"Migrating accounts",
                   "-[AccountsDataMigrator(Internal) _migrateDAAccounts:]. Could not convert the "
                   "description for the Exchange account {}"}));
  EXPECT_FALSE(exists(kLegacyExchangePath));
}

TEST_F(MigrationStagesTest, AFailedExchangeConversionDoesNotKeepTheMailConversionFromRunning) {
  addBrokenLegacyExchangeAccounts();
  addLegacyMailAccounts();
  addSettingsFile(12, {});

  EXPECT_TRUE(migrator.executeMigrationSteps());

  EXPECT_EQ(savedIdentifiers(), TextList{"M"});
}

TEST_F(MigrationStagesTest, AFailedChainStillSavesTheStoreAsCurrent) {
  addSettingsFile(11, {anAccount("A", kMailAccountType, "IMAPAccount")});

  EXPECT_FALSE(FailingUpgrade().executeMigrationSteps());

  EXPECT_EQ(saves(), 1);
  EXPECT_EQ(settingsFile()->find(kPlistVersionKey)->integerValue(), 12);
  EXPECT_FALSE(device.process.shouldSkipNotifications);
}

TEST_F(MigrationStagesTest, AFailedChainKeepsTheLegacyStoresAndTellsNobody) {
  addLegacyMailAccounts();
  addLegacyExchangeAccounts();
  switchMigrationInformationOn();
  device.fileSystem.addFile(autoFetchFile, "");

  EXPECT_FALSE(FailingUpgrade().executeMigrationSteps());

  EXPECT_TRUE(exists(kLegacyMailPath));
  EXPECT_TRUE(exists(kLegacyExchangePath));
  EXPECT_TRUE(exists(autoFetchFile));
  EXPECT_EQ(console().back(), "Migrating accounts");
  EXPECT_TRUE(device.preferencesBroadcast.announcements.empty());
}

TEST_F(MigrationStagesTest, AFailedSaveIsNotTheMigrationsResult) {
  addSettingsFile(11, {});
  device.fileSystem.failWhenLineBegins("rename");

  EXPECT_TRUE(migrator.executeMigrationSteps());

  EXPECT_EQ(settingsFile()->find(kPlistVersionKey)->integerValue(), 11);
}

TEST_F(MigrationStagesTest, MigrationDataIsCollatedOnlyWhenAskedFor) {
  addSettingsFile(11, {});
  migrator.executeMigrationSteps();

  EXPECT_FALSE(migrator.collatedMigrationData());
}

}  // namespace
}  // namespace accounts
