#include <gmock/gmock.h>
#include <sys/stat.h>

#include <map>
#include <sstream>

#include "tests/program/HostileRootFixture.h"

// What a person reads when something of a device had to be refused: which path, and why.

namespace accounts {
namespace {

using testing::HasSubstr;

struct Refusal {
  const char* kind;
  const char* path;
  /// A line of standard error, or a part of one.
  const char* line;
};

std::ostream& operator<<(std::ostream& stream, const Refusal& refusal) {
  return stream << refusal.kind << " at " << refusal.path;
}

class HostileRootRefusal : public HostileRootFixture,
                           public testing::WithParamInterface<Refusal> {};

constexpr Refusal kFileRefusals[] = {
    {"ANamedPipe", kDevicePropertyListPath,
     "migration-host: Cannot open /etc/device.plist: It is a named pipe, not a regular file\n"},
    {"ACharacterDevice", kDevicePropertyListPath,
     "migration-host: Cannot open /etc/device.plist: It is a character device, not a regular "
     "file\n"},
    {"ALinkToItself", kDevicePropertyListPath,
     "migration-host: Cannot open /etc/device.plist: Too many levels of symbolic links\n"},
    {"AHugeFile", kDevicePropertyListPath,
     "migration-host: Cannot read /etc/device.plist: File too large\n"},
    {"AnUnreadableFile", kDevicePropertyListPath,
     "migration-host: Cannot open /etc/device.plist: Permission denied\n"},
    {"ASocket", kLockPath, "migration-host: The plug-in reported that it failed"},
    {"ADirectory", kSettingsPath, "\"Failed to save accounts to filesystem.\"\n"},
    {"AnImmutableFile", kSettingsPath, "\"Failed to save accounts to filesystem.\"\n"},
    {"ANamedPipe", kSettingsPath,
     "Error trying to save an accountsettings plist copy: Cannot open "
     "/var/mobile/Library/Preferences/com.quarx.accountsettings.plist: It is a named pipe, not a "
     "regular file\n"},
    {"ADirectory", kSettingsCopyPath,
     "Couldn't remove existing accountsettings copy at "
     "/var/mobile/Library/Logs/CrashReporter/com.quarx.accountsettings.plist\n"},
    {"AnImmutableFile", kLegacyMailPath,
     "-[AccountsDataMigrator(Internal) _removeOldAccountsInfo]. Could not delete "
     "/var/mobile/Library/Mail/Accounts.plist. Error = Cannot remove "
     "/var/mobile/Library/Mail/Accounts.plist: Operation not permitted\n"},
    {"AnImmutableFile", kLegacyExchangePath,
     "-[AccountsDataMigrator(Internal) _removeOldAccountsInfo]. Could not delete "
     "/var/mobile/Library/Preferences/com.quarx.DataAccess.plist. Error = Cannot remove "
     "/var/mobile/Library/Preferences/com.quarx.DataAccess.plist: Operation not permitted\n"},
    {"ADirectory", kSentinelPath,
     "-[AccountsDataMigrator(Internal) _removeOldAccountsInfo]. Could not delete "
     "/var/mobile/Library/Preferences/.removingOldAccounts. Error = Cannot remove "
     "/var/mobile/Library/Preferences/.removingOldAccounts: Is a directory\n"},
    {"ABlockDevice", "/etc/passwd",
     "\"Could not set attributes on the temporary account settings plist. Cannot open /etc/passwd: "
     "It is a block device, not a regular file\"\n"},
    {"AnAbsoluteLinkOut", "/etc/group",
     "\"Could not set attributes on the temporary account settings plist. Cannot open /etc/group: "
     "No such file or directory\"\n"},
};

constexpr Refusal kDirectoryRefusals[] = {
    {"ALinkToItself", "/etc",
     "migration-host: Cannot open /etc/device.plist: Too many levels of symbolic links\n"},
    {"AnAbsoluteLinkOut", "/tmp", "migration-host: The plug-in reported that it failed"},
    {"AFile", "/var/mobile/tmp", "\"Failed to save accounts to filesystem.\"\n"},
    {"AnAbsoluteLinkOut", "/var/mobile/tmp", "\"Failed to save accounts to filesystem.\"\n"},
    {"AFile", kInformationDirectory,
     "AccountMigrator warning: /var/mobile/Library/Logs/CrashReporter/AccountMigration already "
     "exists and is not a directory\n"},
    {"AnAbsoluteLinkOut", kInformationDirectory,
     "AccountMigration warning: Could not create the directory to store migration information at "
     "/var/mobile/Library/Logs/CrashReporter/AccountMigration [Error = Cannot create the directory "
     "/var/mobile/Library/Logs/CrashReporter/AccountMigration: File exists]\n"},
};

class RefusedFile : public HostileRootRefusal {
 protected:
  const HostileKind& kind = hostileFileKind(GetParam().kind);

  void SetUp() override { put(kind, GetParam().path); }
};

class RefusedDirectory : public HostileRootRefusal {
 protected:
  const HostileKind& kind = hostileDirectoryKind(GetParam().kind);

  void SetUp() override { put(kind, GetParam().path); }
};

TEST_P(RefusedFile, IsNamedOnOneLineWithTheReason) {
  EXPECT_THAT(migrateWith(kind, {"--bare"}).errors, HasSubstr(GetParam().line));
}

TEST_P(RefusedDirectory, IsNamedOnOneLineWithTheReason) {
  EXPECT_THAT(migrateWith(kind, {"--bare"}).errors, HasSubstr(GetParam().line));
}

std::string nameOfRefusal(const testing::TestParamInfo<Refusal>& information) {
  std::string name = std::string(information.param.kind) + "At" + information.param.path;
  std::erase_if(name, [](unsigned char character) { return std::isalnum(character) == 0; });
  return name;
}

INSTANTIATE_TEST_SUITE_P(Hostile, RefusedFile, testing::ValuesIn(kFileRefusals), nameOfRefusal);
INSTANTIATE_TEST_SUITE_P(Hostile, RefusedDirectory, testing::ValuesIn(kDirectoryRefusals),
                         nameOfRefusal);

/// The device of these tests without anything hostile: what the refusals above are measured by.
class NothingHostile : public HostileRootFixture {
 protected:
  /// Contents, mode, owner and time of change of a file.
  [[nodiscard]] std::string describe(const std::string& devicePath) const {
    struct stat status {};
    EXPECT_EQ(lstat(onThisMachine(devicePath).c_str(), &status), 0) << devicePath;
    std::ostringstream text;
    text << status.st_mode << " " << status.st_uid << ":" << status.st_gid << " "
         << status.st_mtim.tv_sec << "." << status.st_mtim.tv_nsec << " " << readText(devicePath);
    return text.str();
  }
};

TEST_F(NothingHostile, IsMigratedInEveryWayWithoutARefusal) {
  const ProgramResult result = migrate();

  EXPECT_EQ(result.exitStatus, 0);
  EXPECT_THAT(result.errors, testing::Not(testing::AnyOf(HasSubstr("Cannot"), HasSubstr("Could"),
                                                         HasSubstr("rror"))));
  EXPECT_EQ(readDictionary(kSettingsPath).arrayForKey("Accounts")->size(), 3U);
  EXPECT_FALSE(exists(kLegacyMailPath));
  EXPECT_FALSE(exists(kLegacyExchangePath));
  EXPECT_FALSE(exists(kAutoFetchPath));
  EXPECT_FALSE(std::filesystem::is_empty(onThisMachine(kInformationDirectory)));
}

TEST_F(NothingHostile, ALinkThatStaysInTheRootIsFollowed) {
  std::filesystem::rename(onThisMachine(kLegacyMailPath), onThisMachine("/var/mobile/Elsewhere"));
  std::filesystem::create_symlink("/var/mobile/Elsewhere", onThisMachine(kLegacyMailPath));

  EXPECT_EQ(migrate({"--bare"}).exitStatus, 0);

  EXPECT_EQ(readDictionary(kSettingsPath).arrayForKey("Accounts")->size(), 3U);
  EXPECT_FALSE(exists(kLegacyMailPath));
  EXPECT_TRUE(exists("/var/mobile/Elsewhere"));
}

// Snapshots of images are often made of hard links.
TEST_F(NothingHostile, ASnapshotThatSharesItsFilesStaysAsItIs) {
  std::map<std::string, std::string> before;
  for (const std::string& file : files()) {
    const std::string snapshot = "/snapshot" + file;
    std::filesystem::create_directories(onThisMachine(snapshot).parent_path());
    std::filesystem::create_hard_link(onThisMachine(file), onThisMachine(snapshot));
    before[snapshot] = describe(snapshot);
  }

  EXPECT_EQ(migrate().exitStatus, 0);

  EXPECT_NE(readText(kSettingsPath), readText(std::string("/snapshot") + kSettingsPath));
  for (const auto& [snapshot, description] : before) {
    EXPECT_EQ(describe(snapshot), description) << snapshot;
  }
}

}  // namespace
}  // namespace accounts
