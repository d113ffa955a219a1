#include "migrator/CreateMigrationPlugin.h"

#include "tests/migrator/MigratorFixture.h"

namespace accounts {
namespace {

/// A device that lives as long as the program, as one for the plug-in must.
FakePlatform& lastingDevice() {
  static FakePlatform device;
  return device;
}

TEST(CreateMigrationPluginTest, GivesAnInstanceOfTheAccountsMigrator) {
  const std::unique_ptr<MigrationPluginBase> plugin(
      CreateMigrationPlugin(lastingDevice().platform));

  ASSERT_NE(plugin, nullptr);
  EXPECT_EQ(plugin->dataClassName(), "accounts");
  EXPECT_TRUE(plugin->performMigration());
}

TEST(CreateMigrationPluginTest, ClassOperationsReachThePlatformAfterTheInstanceIsGone) {
  std::unique_ptr<MigrationPluginBase>(CreateMigrationPlugin(lastingDevice().platform)).reset();

  EXPECT_EQ(AccountsManager::fullPathToAccountSettingsPlist(), kSettingsPath);
}

TEST(CreateMigrationPluginTest, ASecondInstanceSharesTheProcessOfTheFirst) {
  const std::unique_ptr<MigrationPluginBase> first(CreateMigrationPlugin(lastingDevice().platform));
  Process& process = Process::current();

  const std::unique_ptr<MigrationPluginBase> second(
      CreateMigrationPlugin(lastingDevice().platform));

  EXPECT_EQ(&Process::current(), &process);
}

TEST(CreateMigrationPluginTest, AnotherPlatformTakesThePlaceOfTheFirst) {
  static FakePlatform otherDevice;
  const std::unique_ptr<MigrationPluginBase> first(CreateMigrationPlugin(lastingDevice().platform));

  const std::unique_ptr<MigrationPluginBase> second(CreateMigrationPlugin(otherDevice.platform));

  EXPECT_EQ(&Process::current().platform, &otherDevice.platform);
}

}  // namespace
}  // namespace accounts
