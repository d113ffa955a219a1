#include <fcntl.h>
#include <sys/file.h>
#include <sys/stat.h>
#include <unistd.h>

#include "tests/program/AccountsctlFixture.h"
#include "tests/program/DeviceRootFixture.h"
#include "tests/program/Programs.h"

namespace accounts {
namespace {

constexpr const char* kAbandonedPath = "/var/mobile/tmp/.accounts-migration-0123456789abcdef";

class AccountsctlStatus : public DeviceRootFixture {
 protected:
  [[nodiscard]] ProgramResult status(const std::vector<std::string>& arguments = {}) const {
    std::vector<std::string> all = {"status", "--root", root()};
    all.insert(all.end(), arguments.begin(), arguments.end());
    return runProgram({.program = accountsctl(), .arguments = all});
  }
  /// The object that tells of the device, which must be pending or not.
  [[nodiscard]] nlohmann::json statusObject(bool isPending) const {
    const ProgramResult result = status({"--json", "--fail-if-pending"});
    const nlohmann::json object = onlyObject(result);
    EXPECT_EQ(object["pending"], isPending);
    EXPECT_EQ(object["exitStatus"], isPending ? kAttention : 0);
    EXPECT_EQ(result.exitStatus, isPending ? kAttention : 0);
    return object;
  }
};

TEST_F(AccountsctlStatus, ARootWithoutAnyDirectoryOfADeviceIsNotNothingToDo) {
  const std::string empty = onThisMachine("/mnt").string();
  std::filesystem::create_directory(empty);

  const ProgramResult result =
      runProgram({.program = accountsctl(), .arguments = {"status", "--root", empty}});

  EXPECT_EQ(result.exitStatus, kMissingInput);
  EXPECT_NE(result.errors.find("is the image mounted?"), std::string::npos) << result.errors;
}

TEST_F(AccountsctlStatus, ADeviceWithoutAccountsHasNothingToDo) {
  const ProgramResult result = status();

  EXPECT_EQ(result.exitStatus, 0);
  EXPECT_EQ(result.output,
            "Account settings\tnone\n"
            "A migration would\tfind nothing to do\n");
  EXPECT_EQ(statusObject(false)["settings"]["exists"], false);
}

TEST_F(AccountsctlStatus, CurrentSettingsHaveNothingToDo) {
  write(kSettingsPath, accountSettings(12));

  const nlohmann::json object = statusObject(false);

  EXPECT_EQ(object["settings"]["version"], 12);
  EXPECT_EQ(object["work"], nlohmann::json::array());
}

TEST_F(AccountsctlStatus, OldSettingsAreToBeUpgraded) {
  write(kSettingsPath, accountSettings(9));

  EXPECT_EQ(status().output,
            "Account settings\tversion 9 (current is 12), 0 accounts\n"
            "A migration would\tupgrade the accounts from version 9 to 12\n");
  EXPECT_EQ(statusObject(true)["work"], nlohmann::json::array({"upgrade"}));
}

TEST_F(AccountsctlStatus, SettingsWithoutAVersionAreNotUpgraded) {
  write(kSettingsPath, PropertyDictionary{{"Accounts", PropertyArray{}}});

  EXPECT_EQ(statusObject(false)["settings"]["version"], nullptr);
}

TEST_F(AccountsctlStatus, LegacyStoresAreToBeConvertedAndUpgraded) {
  write(kLegacyMailPath, PropertyDictionary{});
  write(kLegacyExchangePath, PropertyDictionary{});

  EXPECT_EQ(statusObject(true)["work"],
            nlohmann::json::array({"convertExchangeAccounts", "convertMailAccounts", "upgrade"}));
}

TEST_F(AccountsctlStatus, LegacyStoresBesideCurrentSettingsAreOnlyConverted) {
  write(kSettingsPath, accountSettings(12));
  write(kLegacyMailPath, PropertyDictionary{});

  EXPECT_EQ(statusObject(true)["work"], nlohmann::json::array({"convertMailAccounts"}));
}

TEST_F(AccountsctlStatus, AnInterruptedRemovalIsAllThatIsDone) {
  write(kSettingsPath, accountSettings(9));
  write(kLegacyMailPath, PropertyDictionary{});
  writeText(kSentinelPath, "");

  EXPECT_EQ(statusObject(true)["work"], nlohmann::json::array({"finishRemoval"}));
}

TEST_F(AccountsctlStatus, UnreadableSettingsAreReportedWithTheReason) {
  writeText(kSettingsPath, "not a property list");

  const nlohmann::json object = statusObject(true);

  EXPECT_EQ(object["settings"]["exists"], true);
  EXPECT_NE(object["settings"]["problem"].get<std::string>().find("in line 1"), std::string::npos);
}

TEST_F(AccountsctlStatus, AMigrationThatWouldFailIsForetold) {
  write(kSettingsPath, accountSettings(9));
  writeText(kSentinelPath, "");

  EXPECT_EQ(status().output.substr(status().output.rfind("\nA migration") + 1),
            "A migration would fail: The plug-in reported success but the settings file has not "
            "the current version, although " +
                std::string(kSentinelPath) +
                " says that the legacy stores were being removed after a migration; without that "
                "file a run migrates them; nothing is changed\n");
  EXPECT_EQ(statusObject(true)["ledger"], nullptr);
}

TEST_F(AccountsctlStatus, KeptInputsAreNamed) {
  const std::string folder = "/var/mobile/Library/AccountMigration/Kept-20260101T000000Z";
  writeText(folder + "/file", "");
  writeText("/var/mobile/Library/AccountMigration/Other-20260101T000000Z/file", "");

  EXPECT_EQ(statusObject(true)["keptFolders"], nlohmann::json::array({folder}));
  EXPECT_NE(status().output.find("Kept inputs\t" + folder + "\n"), std::string::npos);
}

TEST_F(AccountsctlStatus, AbandonedTemporaryFilesAreNamedButNotPending) {
  writeText(kAbandonedPath, "");

  EXPECT_EQ(statusObject(false)["abandonedFiles"], nlohmann::json::array({kAbandonedPath}));
}

TEST_F(AccountsctlStatus, TemporaryFilesInUseAreNotAbandoned) {
  writeText(kAbandonedPath, "");
  const int maker = open(onThisMachine(kAbandonedPath).c_str(), O_RDWR | O_CLOEXEC);
  ASSERT_EQ(flock(maker, LOCK_EX), 0);

  EXPECT_EQ(statusObject(false)["abandonedFiles"], nlohmann::json::array());
  close(maker);
}

TEST_F(AccountsctlStatus, NothingOnTheDeviceIsChanged) {
  write(kSettingsPath, accountSettings(9));
  write(kLegacyMailPath, PropertyDictionary{});
  writeText(kAbandonedPath, "");
  const std::vector<std::string> before = files();

  (void)status();

  EXPECT_EQ(files(), before);
}

TEST_F(AccountsctlStatus, ALinkOutOfTheRootIsNotFollowed) {
  std::filesystem::create_directories(onThisMachine(kSettingsPath).parent_path());
  std::filesystem::create_symlink("/etc/passwd", onThisMachine(kSettingsPath));
  std::filesystem::remove(onThisMachine("/etc/passwd"));

  EXPECT_EQ(statusObject(false)["settings"]["exists"], false);
}

TEST_F(AccountsctlStatus, AnotherHomeIsLookedAtOnRequest) {
  write("/home/ada/Library/Mail/Accounts.plist", PropertyDictionary{});

  EXPECT_EQ(onlyObject(status({"--json"}))["work"], nlohmann::json::array());
  EXPECT_EQ(onlyObject(status({"--json", "--home", "/home/ada"}))["work"],
            nlohmann::json::array({"convertMailAccounts", "upgrade"}));
}

TEST_F(AccountsctlStatus, WithoutARootOrWithAMissingOneItIsRefused) {
  expectRefused(runProgram({.program = accountsctl(), .arguments = {"status"}}), kUnusableArguments,
                "--root");
  expectRefused(
      runProgram({.program = accountsctl(), .arguments = {"status", "--root", root() + "/none"}}),
      kMissingInput, "none");
  expectRefused(status({"--home", "relative"}), kUnusableArguments, "--home");
}

TEST_F(AccountsctlStatus, ABrokenDeviceDescriptionIsMissingInput) {
  writeText(kDevicePropertyListPath, "broken");

  expectRefused(status(), kMissingInput, "/etc/device.plist");
}

TEST_F(AccountsctlStatus, AfterAMigrationNothingIsPending) {
  write(kSettingsPath, accountSettings(9));
  write(kLegacyMailPath, PropertyDictionary{});
  ASSERT_EQ(migrate().exitStatus, 0);

  EXPECT_EQ(statusObject(false)["settings"]["version"], 12);
}

}  // namespace
}  // namespace accounts
