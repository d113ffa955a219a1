#include <fcntl.h>
#include <sys/file.h>
#include <unistd.h>

#include <filesystem>
#include <future>
#include <thread>

#include "tests/program/DeviceRootFixture.h"
#include "tests/program/ExitStatuses.h"
#include "tests/program/ListedLocks.h"

namespace accounts {
namespace {

/// The result that the host sees of each kind of migration.
class DriverResult : public DeviceRootFixture {
 protected:
  /// The migration fails at once because its lock cannot be made, and changes nothing.
  void expectNoLock() const {
    write(kSettingsPath, accountSettings(11));
    const std::string settingsBefore = readText(kSettingsPath);

    const ProgramResult result = migrate({"--json"});

    EXPECT_EQ(result.exitStatus, 1);
    EXPECT_EQ(onlyObject(result)["result"], false);
    EXPECT_EQ(onlyObject(result)["broadcasts"], nlohmann::json::array());
    EXPECT_EQ(result.errorLines().size(), 1U) << result.errors;
    EXPECT_EQ(readText(kSettingsPath), settingsBefore);
    EXPECT_FALSE(exists(kSettingsCopyPath));
  }
};

TEST_F(DriverResult, TheTemporaryFilesOfAKilledMigrationAreGoneAfterTheNextOneBareOrNot) {
  const std::vector<std::string> abandoned = {
      "/var/mobile/tmp/.accounts-migration-0123456789abcdef",
      "/var/mobile/Library/Preferences/.accounts-migration-0123456789abcdef",
      std::string(kInformationDirectory) + "/.accounts-migration-0123456789abcdef"};
  for (const std::vector<std::string>& arguments :
       {std::vector<std::string>(), std::vector<std::string>{"--bare"}}) {
    for (const std::string& each : abandoned) {
      writeText(each, "half a file");
    }

    EXPECT_EQ(migrate(arguments).exitStatus, 0);

    for (const std::string& each : abandoned) {
      EXPECT_FALSE(exists(each)) << each;
    }
  }
}

TEST_F(DriverResult, WithoutADirectoryForTheLockItIsFalse) {
  std::filesystem::remove(onThisMachine("/tmp"));

  expectNoLock();
}

TEST_F(DriverResult, WithASymbolicLinkForALockItIsFalse) {
  writeText("/tmp/elsewhere", "");
  std::filesystem::create_symlink("elsewhere", onThisMachine(kLockPath));

  expectNoLock();
}

TEST_F(DriverResult, WithADirectoryForALockItIsFalse) {
  std::filesystem::create_directory(onThisMachine(kLockPath));

  expectNoLock();
}

TEST_F(DriverResult, WithTheLockOfAFinishedMigrationItIsTrue) {
  writeText(kLockPath, "left by somebody");

  EXPECT_EQ(migrate().exitStatus, 0);
  EXPECT_EQ(readText(kLockPath), "left by somebody");
}

TEST_F(DriverResult, WhileAnotherProcessHoldsTheLockItIsWaitedFor) {
  constexpr mode_t kOwnerOnly = 0600;
  const int lock = open(onThisMachine(kLockPath).c_str(), O_CREAT | O_RDWR | O_CLOEXEC, kOwnerOnly);
  ASSERT_EQ(flock(lock, LOCK_EX), 0);
  const std::filesystem::path lockFile = onThisMachine(kLockPath);
  if (!isLockListed(lockFile)) {
    close(lock);
    GTEST_SKIP() << "This system does not list its file locks.";
  }

  std::future<ProgramResult> result = std::async(std::launch::async, [this] { return migrate(); });
  while (listedLockWaiters(lockFile) == 0) {
    std::this_thread::yield();
  }

  EXPECT_FALSE(exists(kSettingsPath));
  close(lock);
  EXPECT_EQ(result.get().exitStatus, 0);
  EXPECT_TRUE(exists(kSettingsPath));
}

TEST_F(DriverResult, AfterAnInterruptedRemovalItIsTrueAndOnlyTheRemovalIsFinished) {
  writeText(kSentinelPath, "Old Account Information Removal Sentinel");
  write(kSettingsPath, accountSettings(3));
  write(kLegacyMailPath, PropertyDictionary{{"MailAccounts", PropertyArray{}}});
  const std::string settingsBefore = readText(kSettingsPath);

  // The safety net would not take settings of such a version for migrated ones.
  const ProgramResult result = migrate({"--json", "--bare"});

  EXPECT_EQ(result.exitStatus, 0);
  EXPECT_TRUE(result.hasErrorLine(
      "Detected that a removal old accounts info was in progress. Early return!."));
  EXPECT_EQ(onlyObject(result)["broadcasts"], nlohmann::json::array());
  EXPECT_FALSE(exists(kLegacyMailPath));
  EXPECT_FALSE(exists(kSentinelPath));
  EXPECT_EQ(readText(kSettingsPath), settingsBefore);
}

TEST_F(DriverResult, WithNothingToMigrateItIsTrueAndTheFileIsWrittenAgain) {
  write(kSettingsPath, accountSettings(20));
  writeText("/var/mobile/Library/Mail/AutoFetchEnabled", "");

  const ProgramResult result = migrate();

  EXPECT_EQ(result.exitStatus, 0);
  EXPECT_EQ(result.errors, "");
  EXPECT_EQ(readDictionary(kSettingsPath), accountSettings(12));
  EXPECT_FALSE(exists("/var/mobile/Library/Mail/AutoFetchEnabled"));
}

TEST_F(DriverResult, OnANewDeviceItIsTrueAndAnEmptyFileIsWritten) {
  const ProgramResult result = migrate();

  EXPECT_EQ(result.exitStatus, 0);
  EXPECT_EQ(readDictionary(kSettingsPath), accountSettings(12));
}

TEST_F(DriverResult, WithAnOldSettingsFileItIsThatOfTheUpgradeChain) {
  write(kSettingsPath, accountSettings(3));

  const ProgramResult result = migrate();

  EXPECT_EQ(result.exitStatus, 0);
  EXPECT_TRUE(result.hasErrorLine("Migrating accounts"));
  EXPECT_EQ(readDictionary(kSettingsPath), accountSettings(12));
}

TEST_F(DriverResult, AFailedConversionIsNotTheResultOfTheMigration) {
  write(kLegacyExchangePath,
        PropertyDictionary{{"DAAccountsKey", PropertyArray{PropertyDictionary{}}}});

  const ProgramResult result = migrate();

  EXPECT_EQ(result.exitStatus, kNotAllCarriedOver);
  EXPECT_NE(result.errors.find("Could not convert the description for the Exchange account"),
            std::string::npos)
      << result.errors;
  EXPECT_FALSE(exists(kLegacyExchangePath));
}

}  // namespace
}  // namespace accounts
