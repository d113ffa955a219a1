#include <sys/stat.h>
#include <unistd.h>

#include <filesystem>
#include <fstream>

#include "tests/program/DeviceRootFixture.h"
#include "tests/program/Programs.h"

namespace accounts {
namespace {

constexpr uid_t kSomeUser = 54321;
constexpr uid_t kSomeOtherUser = 54322;

/// Migrations that are run by a user without privileges.
class Unprivileged : public DeviceRootFixture {
 protected:
  void SetUp() override {
    if (getuid() != 0) {
      GTEST_SKIP() << "Only root can run the program as another user.";
    }
    const ProgramResult result =
        runProgram({.program = migrationHost(), .arguments = {"--version"}, .user = kSomeUser});
    if (result.exitStatus != 0) {
      GTEST_SKIP() << "Another user may not run " << migrationHost();
    }
    write(kSettingsPath, accountSettings(11));
    std::filesystem::permissions(onThisMachine("/"), std::filesystem::perms(0755));
    std::filesystem::permissions(onThisMachine("/tmp"), std::filesystem::perms(01777));
  }

  [[nodiscard]] ProgramResult migrateAs(uid_t user,
                                        const std::vector<std::string>& arguments = {}) const {
    ProgramCall call = migrationCall(arguments);
    call.user = user;
    return runProgram(call);
  }

  void expectSettingsAsTheyWere(const std::string& settingsBefore) const {
    EXPECT_EQ(readText(kSettingsPath), settingsBefore);
    if (exists("/var/mobile/tmp")) {
      EXPECT_TRUE(std::filesystem::is_empty(onThisMachine("/var/mobile/tmp")));
    }
  }
};

TEST_F(Unprivileged, TheMobileUserCanMigrate) {
  giveTo(kSomeUser);

  const ProgramResult result = migrateAs(kSomeUser);

  EXPECT_EQ(result.exitStatus, 0) << result.errors;
  EXPECT_EQ(readDictionary(kSettingsPath), accountSettings(12));
}

TEST_F(Unprivileged, AUserWhoMayNotWriteThePreferencesLeavesThemAsTheyWere) {
  const std::string settingsBefore = readText(kSettingsPath);

  const ProgramResult result = migrateAs(kSomeUser, {"--channel", "-", "--bare"});

  EXPECT_NE(result.errors.find("\"Failed to save accounts to filesystem.\""), std::string::npos)
      << result.errors;
  expectSettingsAsTheyWere(settingsBefore);
}

TEST_F(Unprivileged, AUserWhoCannotWriteTheSettingsFileIsToldWhy) {
  const std::string settingsBefore = readText(kSettingsPath);
  const std::vector<std::string> filesBefore = files();

  const ProgramResult result = migrateAs(kSomeUser);

  EXPECT_EQ(result.exitStatus, 2);
  EXPECT_TRUE(result.hasErrorLine(
      "migration-host: The plug-in reported success but the settings file was not written: A file "
      "cannot be given to mobile: Operation not permitted; nothing is changed"))
      << result.errors;
  expectSettingsAsTheyWere(settingsBefore);
  std::vector<std::string> filesAfter = files();
  std::erase(filesAfter, kLockPath);
  EXPECT_EQ(filesAfter, filesBefore);
}

TEST_F(Unprivileged, AFileThatCannotBeReadIsNotTakenForAMissingOne) {
  giveTo(kSomeUser);
  writeText(kLegacyMailPath, "of another user");
  ASSERT_EQ(chown(onThisMachine(kLegacyMailPath).c_str(), kSomeOtherUser, kSomeOtherUser), 0);
  std::filesystem::permissions(onThisMachine(kLegacyMailPath), std::filesystem::perms::none);
  const std::vector<std::string> filesBefore = files();

  const ProgramResult result = migrateAs(kSomeUser);

  EXPECT_EQ(result.exitStatus, 66);
  EXPECT_EQ(result.errors,
            "migration-host: Cannot open /var/mobile/Library/Mail/Accounts.plist: Permission "
            "denied\n");
  std::vector<std::string> filesAfter = files();
  std::erase(filesAfter, kLockPath);
  EXPECT_EQ(filesAfter, filesBefore);
}

TEST_F(Unprivileged, AUserWhoMayNotGiveTheFileToMobileLeavesItAsItWas) {
  giveTo(kSomeUser);
  writeText("/etc/passwd", "mobile:*:" + std::to_string(kSomeOtherUser) + ":" +
                               std::to_string(kSomeOtherUser) + ":::\n");
  const std::string settingsBefore = readText(kSettingsPath);

  const ProgramResult result = migrateAs(kSomeUser, {"--channel", "-"});

  EXPECT_NE(result.errors.find("Could not set attributes on the temporary account settings plist."),
            std::string::npos)
      << result.errors;
  expectSettingsAsTheyWere(settingsBefore);
}

TEST_F(Unprivileged, AUserWhoMayNotMakeTheLockFailsAtOnce) {
  std::filesystem::permissions(onThisMachine("/tmp"), std::filesystem::perms(0755));
  const std::string settingsBefore = readText(kSettingsPath);

  EXPECT_EQ(migrateAs(kSomeUser, {"--bare"}).exitStatus, 1);

  expectSettingsAsTheyWere(settingsBefore);
}

TEST_F(Unprivileged, RootGivesTheFileToTheMobileUser) {
  giveTo(kSomeUser);

  ASSERT_EQ(migrate().exitStatus, 0);

  struct stat information {};
  ASSERT_EQ(stat(onThisMachine(kSettingsPath).c_str(), &information), 0);
  EXPECT_EQ(information.st_uid, kSomeUser);
  EXPECT_EQ(information.st_gid, kSomeUser);
}

}  // namespace
}  // namespace accounts
