#include "tests/migrator/MigratorFixture.h"

namespace accounts {
namespace {

const std::string directory = "/var/mobile/Library/Logs/CrashReporter/AccountMigration";
const std::string file = directory + "/AccountMigrationInformation-2012-9-19-17-9-4.txt";
const std::string savingLine = "Saving collated migration information";

class MigrationInformationTest : public MigratorTest {
 protected:
  /// Runs a migration of an old settings file, after which there is collated data.
  void migrate() {
    switchMigrationInformationOn();
    addSettingsFile(11, {anAccount("A", kMailAccountType, "IMAPAccount")});
    migrator.executeMigrationSteps();
  }
};

TEST_F(MigrationInformationTest, TheFileIsOffUnlessAPreferenceAsksForIt) {
  EXPECT_FALSE(migrator._saveMigrationInformation());
}

TEST_F(MigrationInformationTest, APreferenceSwitchesTheFileOn) {
  switchMigrationInformationOn();

  EXPECT_TRUE(migrator._saveMigrationInformation());
}

TEST_F(MigrationInformationTest, APreferenceWithoutABooleanValueLeavesTheFileOff) {
  setMigrationInformationPreference(PropertyArray());

  EXPECT_FALSE(migrator._saveMigrationInformation());
}

TEST_F(MigrationInformationTest, ThePreferenceIsReadAtMostOncePerProcess) {
  migrator._saveMigrationInformation();
  switchMigrationInformationOn();

  EXPECT_FALSE(migrator._saveMigrationInformation());
  EXPECT_FALSE(AccountsDataMigrator()._saveMigrationInformation());
  EXPECT_EQ(device.preferenceDomain.calls,
            (Lines{"synchronize com.quarx.accountsettings-logging",
                   "copyValue ASSaveMigrationInformation of com.quarx.accountsettings-logging"}));
}

TEST_F(MigrationInformationTest, TheFileHoldsTheSettingsBeforeAndAfter) {
  switchMigrationInformationOn();
  addSettingsFile(11, {anAccount("A", kMailAccountType, "IMAPAccount")});
  const std::optional<PropertyDictionary> before = settingsFile();

  migrator.executeMigrationSteps();

  const std::optional<PropertyDictionary> information = device.dictionaryAt(file);
  ASSERT_TRUE(information);
  EXPECT_EQ(information->size(), 2u);
  EXPECT_EQ(information->dictionaryForKey("OldAccountSettings"), before);
  EXPECT_EQ(information->dictionaryForKey("NewAccounSettings"), settingsFile());
}

TEST_F(MigrationInformationTest, TheFileHoldsTheLegacyStores) {
  switchMigrationInformationOn();
  const PropertyDictionary mail = {{"MailAccounts", PropertyArray()}, {"Other", 1}};
  const PropertyDictionary exchange = {{"DAAccountsKey", PropertyArray()}};
  device.addPropertyList(kLegacyMailPath, mail);
  device.addPropertyList(kLegacyExchangePath, exchange);

  migrator.executeMigrationSteps();

  const std::optional<PropertyDictionary> information = device.dictionaryAt(file);
  ASSERT_TRUE(information);
  EXPECT_EQ(information->dictionaryForKey("OldMailAccounts"), mail);
  EXPECT_EQ(information->dictionaryForKey("OldExchangeAccount"), exchange);
  EXPECT_EQ(information->dictionaryForKey("OldAccountSettings"), PropertyDictionary());
}

TEST_F(MigrationInformationTest, EmptyDictionariesStandInForUnreadableFiles) {
  switchMigrationInformationOn();
  device.fileSystem.addFile(kLegacyMailPath, "unreadable");
  device.fileSystem.addFile(kLegacyExchangePath, "unreadable");
  device.fileSystem.failWhenLineBegins("rename");

  migrator.executeMigrationSteps();

  const PropertyDictionary none;
  EXPECT_EQ(device.dictionaryAt(file), (PropertyDictionary{{"OldMailAccounts", none},
                                                           {"OldExchangeAccount", none},
                                                           {"OldAccountSettings", none},
                                                           {"NewAccounSettings", none}}));
}

TEST_F(MigrationInformationTest, TheDirectoryIsOpenToEverybody) {
  migrate();

  EXPECT_EQ(device.fileSystem.directories.at(directory), 0777u);
}

TEST_F(MigrationInformationTest, TheDateOfTheNameFollowsItsPattern) {
  migrate();

  EXPECT_EQ(device.dateFormatter.patterns, Lines{"Y-M-d-H-M-S"});
}

TEST_F(MigrationInformationTest, ADirectoryThatIsThereIsUsed) {
  device.fileSystem.addDirectory(directory);

  migrate();

  EXPECT_TRUE(exists(file));
  EXPECT_EQ(device.fileSystem.directories.at(directory), 0755u);
}

TEST_F(MigrationInformationTest, WithNothingToMigrateOnlyTheDirectoryIsCreated) {
  switchMigrationInformationOn();

  EXPECT_TRUE(migrator.executeMigrationSteps());

  EXPECT_EQ(console().back(), savingLine);
  EXPECT_TRUE(device.fileSystem.directories.contains(directory));
  EXPECT_FALSE(exists(file));
  EXPECT_FALSE(migrator.collatedMigrationData());
}

TEST_F(MigrationInformationTest, AFileInTheDirectorysPlaceIsLogged) {
  device.fileSystem.addFile(directory, "a file");

  migrate();

  EXPECT_EQ(console().back(),
            "AccountMigrator warning: " + directory + " already exists and is not a directory");
  EXPECT_FALSE(exists(file));
}

TEST_F(MigrationInformationTest, ADirectoryThatCannotBeCreatedIsLogged) {
  device.fileSystem.failWhenLineBegins("createDirectory");

  migrate();

  EXPECT_EQ(console().back(),
            "AccountMigration warning: Could not create the directory to store migration "
            "information at " +
                directory + " [Error = createDirectory " + directory + ": Input/output error]");
  EXPECT_TRUE(device.dateFormatter.patterns.empty()) << "a name was made for the file";
  EXPECT_FALSE(std::ranges::any_of(
      device.journal, [](const std::string& line) { return line.starts_with("writeAtomically"); }));
}

TEST_F(MigrationInformationTest, AFailureToSerialiseIsNotReported) {
  migrate();
  device.fileSystem.files.erase(file);
  device.consoleLog.lines.clear();
  device.propertyLists.serializationError = "no";

  migrator._saveCollatedMigrationInformation();

  EXPECT_EQ(console(), Lines{savingLine});
  EXPECT_FALSE(exists(file));
}

TEST_F(MigrationInformationTest, AFailureToWriteIsNotReported) {
  device.fileSystem.failWhenLineBegins("writeAtomically");

  migrate();

  EXPECT_EQ(console().back(), savingLine);
  EXPECT_FALSE(exists(file));
}

TEST_F(MigrationInformationTest, AConversionOutsideAMigrationCollectsNothing) {
  switchMigrationInformationOn();
  device.addPropertyList(kLegacyMailPath, PropertyDictionary{{"MailAccounts", PropertyArray()}});

  EXPECT_TRUE(migrator._migrateMailAccounts(*store));
  migrator._saveCollatedMigrationInformation();

  EXPECT_FALSE(exists(file));
}

}  // namespace
}  // namespace accounts
