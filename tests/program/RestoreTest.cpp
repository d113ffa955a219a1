#include <fcntl.h>
#include <sys/file.h>
#include <sys/stat.h>
#include <unistd.h>

#include <cstring>
#include <filesystem>

#include "platform/linux/FileDescriptor.h"
#include "tests/program/DeviceTree.h"
#include "tests/program/ExitStatuses.h"
#include "tests/program/Programs.h"
#include "tests/program/SafetyNetFixture.h"

namespace accounts {
namespace {

/// `migration-host restore` on a device whose settings file was refused and replaced.
class Restore : public SafetyNetFixture {
 protected:
  void SetUp() override {
    writeText(kSettingsPath, "refused");
    ASSERT_EQ(migrate().exitStatus, kNotAllCarriedOver);
    folder = onlyKeptFolder();
    name = std::filesystem::path(folder).filename();
    migrated = readText(kSettingsPath);
  }

  void expectRefused(const ProgramResult& result, int exitStatus, const std::string& message) {
    EXPECT_EQ(result.exitStatus, exitStatus);
    EXPECT_EQ(result.output, "");
    EXPECT_EQ(result.errors, "migration-host: " + message + "\n");
    EXPECT_EQ(readText(kSettingsPath), migrated);
    EXPECT_TRUE(exists(folder));
  }

  std::string folder, name, migrated;
};

TEST_F(Restore, PutsTheFilesBackAndKeepsWhatTheyReplace) {
  const ProgramResult result = restore();

  EXPECT_EQ(result.exitStatus, 0) << result.errors;
  EXPECT_EQ(readText(kSettingsPath), "refused");
  ASSERT_EQ(hostFolders().size(), 1u);
  const std::string replaced = hostFolders()[0];
  EXPECT_EQ(readText(replaced + "/Settings"), migrated);
  EXPECT_FALSE(exists(kSettingsCopyPath));
  EXPECT_EQ(readText(replaced + "/CopyAside"), "refused");
  EXPECT_EQ(result.output, "Put back " + std::string(kSettingsPath) + "\nRemoved " +
                               std::string(kSettingsCopyPath) +
                               ", where nothing was before\nWhat was there is kept in " + replaced +
                               "\n");
  EXPECT_EQ(result.errors, "");
}

TEST_F(Restore, TellsInJSONWhatItDid) {
  const ProgramResult result = restore({"--json", "--from", name});

  const nlohmann::json expected = {{"root", root()},
                                   {"from", folder},
                                   {"restored", {kSettingsPath}},
                                   {"removed", {kSettingsCopyPath}},
                                   {"replaced", hostFolders().at(0)},
                                   {"exitStatus", 0}};
  EXPECT_EQ(onlyObject(result), expected);
}

TEST_F(Restore, LeavesWhatItReplacedWithoutAWarningOfTheNextRun) {
  ASSERT_EQ(restore().exitStatus, 0);
  write(kSettingsPath, accountSettings(12));

  EXPECT_EQ(migrate().errors, "");

  EXPECT_EQ(hostFolders().size(), 1u);
}

TEST_F(Restore, NamesTheFoldersWhereThereAreSeveral) {
  writeText(std::string(kAccountMigration) + "/Kept-19990101T000000Z/Accounts.plist", "older");

  expectRefused(
      restore(), 64,
      "Several folders hold kept files, --from must name one: Kept-19990101T000000Z " + name);

  EXPECT_EQ(restore({"--from", folder}).exitStatus, 0);
  EXPECT_FALSE(exists(kLegacyMailPath));
}

TEST_F(Restore, RefusesAFolderThatIsNotThere) {
  expectRefused(restore({"--from", "Kept-missing"}), 66, "No folder of kept files: Kept-missing");
  expectRefused(restore({"--from", "../Preferences"}), 66,
                "No folder of kept files: ../Preferences");
}

TEST_F(Restore, RefusesAFolderThatIsALink) {
  std::filesystem::create_directory_symlink(name, onThisMachine(kAccountMigration) / "Kept-link");

  expectRefused(restore({"--from", "Kept-link"}), 66, "No folder of kept files: Kept-link");
}

TEST_F(Restore, RefusesARootThatIsNotThere) {
  const ProgramResult result = runProgram(
      {.program = migrationHost(), .arguments = {"restore", "--root", root() + "missing"}});

  EXPECT_EQ(result.exitStatus, 66);
  EXPECT_EQ(result.errorLines().size(), 1u) << result.errors;
}

TEST_F(Restore, ReportsAnErrorInJSONAsWell) {
  const ProgramResult result = restore({"--json", "--from", "Kept-missing"});

  EXPECT_EQ(result.exitStatus, 66);
  const nlohmann::json object = onlyObject(result);
  EXPECT_EQ(object["restored"], nlohmann::json::array());
  EXPECT_EQ(object["exitStatus"], 66);
  EXPECT_EQ(object["error"], "No folder of kept files: Kept-missing");
}

TEST_F(Restore, KeepsALinkThatItReplacesAndLeavesWhatItLeadsTo) {
  std::filesystem::remove(onThisMachine(kSettingsPath));
  std::filesystem::create_symlink("/etc/passwd", onThisMachine(kSettingsPath));
  const std::string passwords = readText("/etc/passwd");

  const ProgramResult result = restore();

  EXPECT_EQ(result.exitStatus, 0) << result.errors;
  EXPECT_EQ(readText(kSettingsPath), "refused");
  EXPECT_TRUE(std::filesystem::is_symlink(onThisMachine(hostFolders().at(0) + "/Settings")));
  EXPECT_EQ(readText("/etc/passwd"), passwords);
}

TEST_F(Restore, DoesNotReplaceADirectory) {
  std::filesystem::remove(onThisMachine(kSettingsPath));
  std::filesystem::create_directory(onThisMachine(kSettingsPath));

  const ProgramResult result = restore();

  EXPECT_EQ(result.exitStatus, 73);
  EXPECT_TRUE(std::filesystem::is_directory(onThisMachine(kSettingsPath)));
  EXPECT_TRUE(exists(folder));
}

TEST_F(Restore, WithNothingKeptSaysSo) {
  ASSERT_EQ(restore().exitStatus, 0);

  const ProgramResult result = restore();

  EXPECT_EQ(result.exitStatus, 66);
  EXPECT_EQ(result.errors,
            "migration-host: No files are kept in /var/mobile/Library/AccountMigration\n");
}

TEST_F(Restore, BringsBackBytesOwnersModesAndTimesOfAllThatARunReplacesOrRemoves) {
  ASSERT_EQ(restore().exitStatus, 0);
  std::filesystem::remove_all(onThisMachine(kAccountMigration));
  std::filesystem::remove(onThisMachine(kSettingsPath));
  const std::vector<std::string> changed = {
      kSettingsPath,       kSettingsCopyPath,
      kLegacyMailPath,     kLegacyMailPath + std::string(".original"),
      kLegacyExchangePath, kLegacyExchangePath + std::string(".original"),
      kAutoFetchPath};
  write(kSettingsPath, accountSettings(3));
  write(kLegacyMailPath, legacyMail());
  write(kLegacyExchangePath, PropertyDictionary{{"DAAccountsKey", PropertyArray{}}});
  // Each with a mode and, where the test may, an owner of its own, written long ago.
  mode_t mode = 0600;
  for (const std::string& each : changed) {
    if (!exists(each)) {
      writeText(each, "bytes of " + each);
    }
    const std::string path = onThisMachine(each);
    ASSERT_EQ(chmod(path.c_str(), ++mode), 0);
    ASSERT_TRUE(geteuid() != 0 || chown(path.c_str(), mode, mode) == 0);
    const timespec times[] = {{0, UTIME_OMIT}, {1000000000 + mode, 123456789}};
    ASSERT_EQ(utimensat(AT_FDCWD, path.c_str(), times, 0), 0);
  }
  const DeviceTree before = treeOf(onThisMachine("/"));
  ASSERT_EQ(migrate({"--keep"}).exitStatus, 0);
  for (const std::string& each : changed) {
    EXPECT_FALSE(exists(each) && readText(each) == before.at(each).contents) << each;
  }

  ASSERT_EQ(restore().exitStatus, 0);

  const DeviceTree after = treeOf(onThisMachine("/"));
  mode = 0600;
  for (const std::string& each : changed) {
    ASSERT_TRUE(after.contains(each)) << each;
    EXPECT_EQ(after.at(each), before.at(each)) << each;
    EXPECT_EQ(statusOf(each).st_mtim.tv_sec, 1000000000 + ++mode) << each;
    EXPECT_EQ(statusOf(each).st_mtim.tv_nsec, 123456789) << each;
  }
}

TEST_F(Restore, PutsBackWhatWasInAnotherHome) {
  std::filesystem::remove_all(onThisMachine(kAccountMigration));
  write(kSettingsPath, accountSettings(12));
  const std::string home = "/home/ada";
  const std::string mail = home + std::string(kLegacyMailPath).substr(strlen("/var/mobile"));
  std::filesystem::create_directories(onThisMachine(home + "/Library/Preferences"));
  write(mail, legacyMail());
  ASSERT_EQ(migrate({"--home", home, "--keep"}).exitStatus, 0);
  ASSERT_FALSE(exists(mail));

  EXPECT_EQ(restore({"--home", home}).exitStatus, 0);

  EXPECT_TRUE(exists(mail));
  EXPECT_FALSE(exists(kLegacyMailPath));
}

TEST_F(Restore, ChangesNothingWhileAMigrationHoldsItsLock) {
  const FileDescriptor lock(open(onThisMachine(kLockPath).c_str(), O_RDWR | O_CLOEXEC));
  ASSERT_EQ(flock(lock.number(), LOCK_EX), 0);

  expectRefused(restore({"--lock-timeout", "0"}), kMayPass,
                "Another process has had the migration lock for 0 seconds");
  EXPECT_EQ(restore({"--list"}).exitStatus, 0);
}

TEST_F(Restore, EndsWhatWouldTakeTheStoresForConvertedOnes) {
  ASSERT_EQ(restore().exitStatus, 0);
  std::filesystem::remove_all(onThisMachine(kAccountMigration));
  std::filesystem::remove(onThisMachine(kSettingsPath));
  write(kSettingsPath, accountSettings(12));
  write(kLegacyMailPath, legacyMail());
  ASSERT_EQ(migrate({"--keep"}).exitStatus, 0);
  writeText(kSentinelPath, "Old Account Information Removal Sentinel");

  EXPECT_EQ(restore().exitStatus, 0);
  EXPECT_FALSE(exists(kSentinelPath));
  EXPECT_EQ(accountIdentifiers(), std::vector<std::string>{});

  EXPECT_EQ(migrate().exitStatus, 0);
  EXPECT_EQ(accountIdentifiers(), std::vector<std::string>{"M"});
}

}  // namespace
}  // namespace accounts
