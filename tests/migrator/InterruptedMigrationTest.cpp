// What the rules give up on purpose when a migration is interrupted or cannot save. The host's
// safety net is for these; the plug-in alone must keep behaving so.

#include "tests/migrator/MigratorFixture.h"

namespace accounts {
namespace {

class InterruptedMigrationTest : public MigratorTest {
 protected:
  void addLegacyMailAccount(std::string_view identifier) {
    device.addPropertyList(kLegacyMailPath,
                           PropertyDictionary{{"MailAccounts", PropertyArray{PropertyDictionary{
                                                                   {"AccountType", "IMAPAccount"},
                                                                   {"uniqueId", identifier}}}}});
  }
  void addLegacyExchangeAccount() {
    device.addPropertyList(
        kLegacyExchangePath,
        PropertyDictionary{{"DAAccountsKey", PropertyArray{PropertyDictionary{
                                                 {"DAAccountConfigurationClass", "ASAccount"},
                                                 {"DAAccountConfigurationAccountID", "E"}}}}});
  }
  /// Runs a migration that ends like a killed process after its first operation of a kind.
  void migrateUntil(const std::string& lineBeginning) {
    for (std::size_t operation = 0;
         device.journal.empty() || !device.journal.back().starts_with(lineBeginning); ++operation) {
      device.fileSystem.files = filesBefore();
      device.journal.clear();
      device.fileSystem.removeFaults();
      device.fileSystem.stopAfter(device.fileSystem.operationCount() + operation);
      EXPECT_THROW(AccountsDataMigrator().performMigration(), WorldStopped);
    }
    device.fileSystem.removeFaults();
    device.journal.clear();
    device.consoleLog.lines.clear();
  }
  TextList savedIdentifiers() const {
    TextList result;
    const PropertyArray saved = *settingsFile()->arrayForKey(kPlistAccountsKey);
    for (const PropertyValue& each : saved) {
      result.push_back(each.asDictionary()->textForKey(kAccountIdentifier)->string());
    }
    return result;
  }

 private:
  /// The files at the first call.
  const std::map<std::string, FakeFile, std::less<>>& filesBefore() {
    if (!filesBefore_) {
      filesBefore_ = device.fileSystem.files;
    }
    return *filesBefore_;
  }
  std::optional<std::map<std::string, FakeFile, std::less<>>> filesBefore_;
};

TEST_F(InterruptedMigrationTest, AChainInterruptedAfterItsFirstSaveIsNotTakenUpAgain) {
  addSettingsFile(6, {anAccount("A", kMailAccountType, "IMAPAccount")});

  migrateUntil("rename");
  EXPECT_TRUE(migrator.performMigration());

  EXPECT_TRUE(console().empty()) << "no \"Migrating accounts\"";
  EXPECT_EQ(saves(), 1);
  EXPECT_EQ(settingsFile()->find(kPlistVersionKey)->integerValue(), 12);
  EXPECT_EQ(savedIdentifiers(), TextList{"A"});
}

TEST_F(InterruptedMigrationTest, AChainInterruptedBeforeItsFirstSaveRunsFromTheBeginning) {
  addSettingsFile(6, {anAccount("A", kMailAccountType, "IMAPAccount")});

  migrateUntil("write");
  EXPECT_TRUE(migrator.performMigration());

  EXPECT_EQ(console(), Lines{"Migrating accounts"});
  EXPECT_EQ(saves(), 7);
}

TEST_F(InterruptedMigrationTest, LegacyAccountsAreConvertedAgainUntilTheirRemovalHasBegun) {
  addLegacyMailAccount("M");
  addSettingsFile(12, {});

  migrateUntil("rename");
  EXPECT_TRUE(migrator.performMigration());

  EXPECT_EQ(console(), Lines{"Migrating accounts"});
  EXPECT_EQ(savedIdentifiers(), TextList{"M"});
  EXPECT_FALSE(exists(kLegacyMailPath));
}

TEST_F(InterruptedMigrationTest,
       ALegacyAccountConvertedAgainIsMergedWithTheParentThatItGotMeanwhile) {
  addLegacyMailAccount("M");
  addSettingsFile(12, {anAccount("P", kVelmoraAccountType, "VelmoraAccount")
                           .withChildren({anAccount("M", kMailAccountType, "IMAPAccount")})});

  EXPECT_TRUE(migrator.performMigration());

  EXPECT_EQ(savedIdentifiers(), (TextList{"P", "P"}));
}

TEST_F(InterruptedMigrationTest, AFailedSaveDoesNotKeepTheLegacyStores) {
  addLegacyMailAccount("M");
  device.fileSystem.failWhenLineBegins("rename");

  EXPECT_TRUE(migrator.performMigration());

  EXPECT_FALSE(exists(kSettingsPath));
  EXPECT_FALSE(exists(kLegacyMailPath));
}

TEST_F(InterruptedMigrationTest, ALegacyStoreThatCannotBeReadIsRemovedLikeAnEmptyOne) {
  addLegacyMailAccount("M");
  addSettingsFile(12, {});
  device.fileSystem.failWhenLineBegins("read " + std::string(kLegacyMailPath));

  EXPECT_TRUE(migrator.performMigration());

  EXPECT_EQ(savedIdentifiers(), TextList{});
  EXPECT_FALSE(exists(kLegacyMailPath));
}

TEST_F(InterruptedMigrationTest, ALegacyStoreThatWasNotSeenIsRemovedWithTheOther) {
  addLegacyMailAccount("M");
  addLegacyExchangeAccount();
  addSettingsFile(12, {});
  device.fileSystem.failWhenLineBegins("exists " + std::string(kLegacyMailPath));

  EXPECT_TRUE(migrator.performMigration());

  EXPECT_EQ(savedIdentifiers(), TextList{"E"});
  EXPECT_FALSE(exists(kLegacyMailPath));
}

TEST_F(InterruptedMigrationTest, ASettingsFileThatCannotBeReadIsReplaced) {
  addSettingsFile(12, {anAccount("A", kMailAccountType, "IMAPAccount")});
  device.fileSystem.failWhenLineBegins("read " + std::string(kSettingsPath));

  EXPECT_TRUE(migrator.performMigration());

  EXPECT_EQ(savedIdentifiers(), TextList{});
}

}  // namespace
}  // namespace accounts
