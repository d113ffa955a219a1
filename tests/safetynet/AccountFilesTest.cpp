#include "safetynet/AccountFiles.h"

#include <gtest/gtest.h>

#include "accountsettings/AccountsManager.h"
#include "accountsettings/Paths.h"
#include "migrator/AccountsDataMigrator.h"
#include "tests/fakes/FakePlatform.h"

namespace accounts {
namespace {

/// The host does not share code with the plug-in; these hold the two together.
class AccountFilesTest : public testing::Test {
 protected:
  FakeProcess device;
};

TEST_F(AccountFilesTest, TheFilesAreThoseThatThePluginReplacesAndRemoves) {
  const AccountFiles files = accountFilesInHome(device.homeDirectory.path());

  EXPECT_EQ(files.settings, accountSettingsAccountsPath());
  EXPECT_EQ(files.legacyMail, mailAccountsPath());
  EXPECT_EQ(files.legacyExchange, daAccountPath());
  EXPECT_EQ(files.removalSentinel,
            AccountsDataMigrator()._absolutePathToOldAccountsInfoRemovalSentinel());
}

TEST_F(AccountFilesTest, TheVersionIsTheOneThatThePluginWrites) {
  EXPECT_EQ(static_cast<std::uint64_t>(kMigratedVersion), AccountsManager::currentVersion());
}

TEST_F(AccountFilesTest, TheMigrationsLockIsTheOneThatThePluginTakes) {
  AccountsManager::releaseMigrationLock(AccountsManager::createAndLockMigrationLock());

  EXPECT_EQ(device.journal.front(), "lock " + std::string(kMigrationLockName));
}

TEST_F(AccountFilesTest, TheSettingsFileIsPutBackLast) {
  const AccountFiles files = accountFilesInHome("/var/mobile");

  EXPECT_EQ(files.inputs(),
            (std::vector<std::string>{files.legacyMail, files.legacyExchange, files.settings}));
}

}  // namespace
}  // namespace accounts
