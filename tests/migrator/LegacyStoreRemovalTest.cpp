#include "tests/migrator/MigratorFixture.h"

namespace accounts {
namespace {

class LegacyStoreRemovalTest : public MigratorTest {
 protected:
  void addLegacyStores() {
    addLegacyMailStore();
    device.addPropertyList(kLegacyExchangePath, PropertyDictionary{{"Anything", true}});
  }
  void addLegacyMailStore() {
    device.addPropertyList(kLegacyMailPath, PropertyDictionary{{"Anything", true}});
  }
  /// Lets the conversions find what the legacy stores hold, so that failures to remove it are told.
  void findLegacyAccounts() {
    migrator._migrateDAAccounts(*store);
    migrator._migrateMailAccounts(*store);
    device.journal.clear();
  }
};

const std::string linePrefix =
    "-[AccountsDataMigrator(Internal) _removeOldAccountsInfo]. Could not delete ";

TEST_F(LegacyStoreRemovalTest, TheSentinelStandsInThePreferencesDirectory) {
  EXPECT_EQ(migrator._absolutePathToOldAccountsInfoRemovalSentinel(), kSentinelPath);
}

TEST_F(LegacyStoreRemovalTest, AnInterruptedRemovalIsKnownByTheSentinel) {
  EXPECT_FALSE(migrator._failedToRemoveOldAccountsInfo());

  device.fileSystem.addFile(kSentinelPath, "");
  EXPECT_TRUE(migrator._failedToRemoveOldAccountsInfo());
}

TEST_F(LegacyStoreRemovalTest, BothStoresAreRemovedUnderTheSentinel) {
  addLegacyStores();

  EXPECT_TRUE(migrator._removeOldAccountsInfo());

  const std::string sentinel(kSentinelPath);
  EXPECT_EQ(device.journal,
            (Lines{"exists " + sentinel, "create " + sentinel,
                   "remove " + std::string(kLegacyExchangePath),
                   "remove " + std::string(kLegacyMailPath), "remove " + sentinel}));
  EXPECT_FALSE(exists(kLegacyMailPath));
  EXPECT_FALSE(exists(kLegacyExchangePath));
  EXPECT_FALSE(exists(kSentinelPath));
}

TEST_F(LegacyStoreRemovalTest, TheSentinelSaysWhatItIs) {
  addLegacyStores();
  device.fileSystem.stopAfter(1);

  EXPECT_THROW(migrator._removeOldAccountsInfo(), WorldStopped);

  EXPECT_EQ(device.fileSystem.contentsOf(kSentinelPath),
            "Old Account Information Removal Sentinel");
  EXPECT_TRUE(exists(kLegacyExchangePath));
}

TEST_F(LegacyStoreRemovalTest, ASentinelThatIsThereIsNotCreatedAgain) {
  device.fileSystem.addFile(kSentinelPath, "");

  migrator._removeOldAccountsInfo();

  EXPECT_EQ(std::ranges::count(device.journal, "create " + std::string(kSentinelPath)), 0);
  EXPECT_FALSE(exists(kSentinelPath));
}

TEST_F(LegacyStoreRemovalTest, ASentinelThatCannotBeCreatedDoesNotStopTheRemoval) {
  addLegacyStores();
  device.fileSystem.failWhenLineBegins("create ");

  EXPECT_TRUE(migrator._removeOldAccountsInfo());

  EXPECT_FALSE(exists(kLegacyExchangePath));
  EXPECT_FALSE(exists(kLegacyMailPath));
  EXPECT_EQ(console(), Lines{linePrefix + std::string(kSentinelPath) + ". Error = " +
                             std::string(kSentinelPath) + ": No such file or directory"});
}

TEST_F(LegacyStoreRemovalTest, WithTheMailStoreAloneTheResultIsFalseAndNothingIsLogged) {
  addLegacyMailStore();
  findLegacyAccounts();

  EXPECT_FALSE(migrator._removeOldAccountsInfo());

  EXPECT_FALSE(exists(kLegacyMailPath));
  EXPECT_FALSE(exists(kSentinelPath));
  EXPECT_TRUE(console().empty());
}

TEST_F(LegacyStoreRemovalTest, AFoundExchangeFileThatStaysIsLoggedAndKeepsTheMailStore) {
  addLegacyStores();
  findLegacyAccounts();
  device.fileSystem.failWhenLineBegins("remove " + std::string(kLegacyExchangePath));

  EXPECT_FALSE(migrator._removeOldAccountsInfo());

  const std::string path(kLegacyExchangePath);
  EXPECT_EQ(console(),
            Lines{linePrefix + path + ". Error = remove " + path + ": Input/output error"});
  EXPECT_TRUE(exists(kLegacyMailPath));
  EXPECT_FALSE(exists(kSentinelPath));
}

TEST_F(LegacyStoreRemovalTest, AnExchangeFileNotFoundByAConversionFailsSilently) {
  addLegacyStores();
  device.fileSystem.failWhenLineBegins("remove " + std::string(kLegacyExchangePath));

  EXPECT_FALSE(migrator._removeOldAccountsInfo());

  EXPECT_TRUE(console().empty());
  EXPECT_FALSE(exists(kLegacyMailPath));
}

TEST_F(LegacyStoreRemovalTest, AFoundMailStoreThatStaysIsLogged) {
  addLegacyStores();
  findLegacyAccounts();
  device.fileSystem.failWhenLineBegins("remove " + std::string(kLegacyMailPath));

  EXPECT_TRUE(migrator._removeOldAccountsInfo());

  const std::string path(kLegacyMailPath);
  EXPECT_EQ(console(),
            Lines{linePrefix + path + ". Error = remove " + path + ": Input/output error"});
  EXPECT_FALSE(exists(kSentinelPath));
}

TEST_F(LegacyStoreRemovalTest, AMailStoreNotFoundByAConversionFailsSilently) {
  addLegacyStores();
  device.fileSystem.failWhenLineBegins("remove " + std::string(kLegacyMailPath));

  EXPECT_TRUE(migrator._removeOldAccountsInfo());

  EXPECT_TRUE(console().empty());
}

TEST_F(LegacyStoreRemovalTest, ASentinelThatStaysIsLogged) {
  addLegacyStores();
  device.fileSystem.failWhenLineBegins("remove " + std::string(kSentinelPath));

  EXPECT_TRUE(migrator._removeOldAccountsInfo());

  const std::string path(kSentinelPath);
  EXPECT_EQ(console(),
            Lines{linePrefix + path + ". Error = remove " + path + ": Input/output error"});
}

TEST_F(LegacyStoreRemovalTest, AFreshMigratorFinishesAnInterruptedRemovalWithoutALine) {
  addLegacyMailStore();
  device.fileSystem.addFile(kSentinelPath, "");

  migrator._removeOldAccountsInfo();

  EXPECT_FALSE(exists(kLegacyMailPath));
  EXPECT_FALSE(exists(kSentinelPath));
  EXPECT_TRUE(console().empty());
}

TEST_F(LegacyStoreRemovalTest, EmptyLegacyFilesDoNotCountAsFound) {
  device.addPropertyList(kLegacyMailPath, PropertyDictionary());
  device.addPropertyList(kLegacyExchangePath, PropertyDictionary());
  findLegacyAccounts();
  device.fileSystem.failWhenLineBegins("remove " + std::string(kLegacyExchangePath));
  device.fileSystem.failWhenLineBegins("remove " + std::string(kLegacyMailPath));

  migrator._removeOldAccountsInfo();

  EXPECT_TRUE(console().empty());
}

}  // namespace
}  // namespace accounts
