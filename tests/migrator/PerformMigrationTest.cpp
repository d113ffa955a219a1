#include "tests/migrator/MigratorFixture.h"

namespace accounts {
namespace {

using PerformMigrationTest = MigratorTest;

TEST_F(PerformMigrationTest, TheDataIsNamedAccounts) {
  EXPECT_EQ(migrator.dataClassName(), "accounts");
}

TEST_F(PerformMigrationTest, TheLockIsHeldForTheWholeMigration) {
  EXPECT_TRUE(migrator.performMigration());

  ASSERT_FALSE(device.journal.empty());
  EXPECT_EQ(device.journal.front(), "lock AccountMigrationInProgress");
  EXPECT_EQ(device.journal.back(), "unlock AccountMigrationInProgress");
  EXPECT_EQ(std::ranges::count(device.journal, "unlock AccountMigrationInProgress"), 1);
}

TEST_F(PerformMigrationTest, WithoutALockObjectNothingIsDone) {
  device.sharedResources.canMakeLock = false;

  EXPECT_FALSE(migrator.performMigration());

  EXPECT_EQ(device.fileSystem.operationCount(), 0u);
  EXPECT_EQ(std::ranges::count(device.journal, "unlock AccountMigrationInProgress"), 0);
  EXPECT_TRUE(console().empty());
  EXPECT_TRUE(device.preferencesBroadcast.announcements.empty());
  EXPECT_FALSE(device.process.shouldSkipNotifications);
}

TEST_F(PerformMigrationTest, TheResultIsThatOfTheMigrationSteps) {
  addSettingsFile(11, {});

  EXPECT_FALSE(FailingUpgrade().performMigration());

  EXPECT_EQ(device.journal.back(), "unlock AccountMigrationInProgress");
}

}  // namespace
}  // namespace accounts
