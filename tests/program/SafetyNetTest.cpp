#include <fcntl.h>
#include <poll.h>
#include <sys/stat.h>
#include <unistd.h>

#include <algorithm>
#include <array>
#include <csignal>
#include <filesystem>
#include <functional>
#include <future>

#include "tests/program/ExitStatuses.h"
#include "tests/program/SafetyNetFixture.h"

namespace accounts {
namespace {

enum class Heard : std::uint8_t { Text, End, NothingForLong };

/// Reads until a text has come, or until everyone who could write it has gone.
Heard readUntil(int descriptor, const std::string& text) {
  constexpr int kLong = 20'000;  // milliseconds
  std::string all;
  std::array<char, 256> block{};
  while (all.find(text) == std::string::npos) {
    pollfd readable = {descriptor, POLLIN, 0};
    if (poll(&readable, 1, kLong) <= 0) {
      return Heard::NothingForLong;
    }
    const ssize_t count = read(descriptor, block.data(), block.size());
    if (count <= 0) {
      return Heard::End;
    }
    all.append(block.data(), static_cast<std::size_t>(count));
  }
  return Heard::Text;
}

/// What the host keeps, verifies and puts back around the plug-in.
using SafetyNet = SafetyNetFixture;

TEST_F(SafetyNet, AVerifiedRunLeavesNothingOfItsOwn) {
  write(kSettingsPath, accountSettings(11));
  write(kLegacyMailPath, legacyMail());

  const ProgramResult result = migrate();

  EXPECT_EQ(result.exitStatus, 0) << result.errors;
  EXPECT_FALSE(exists(kAccountMigration));
}

TEST_F(SafetyNet, ARefusedSettingsFileIsKeptWhileAnEmptyOneTakesItsPlace) {
  writeText(kSettingsPath, "bplist00 but not quite");

  const ProgramResult result = migrate({"--json"});

  EXPECT_EQ(result.exitStatus, kNotAllCarriedOver) << result.errors;
  EXPECT_EQ(readDictionary(kSettingsPath), accountSettings(12));
  const std::string folder = onlyKeptFolder();
  EXPECT_EQ(readText(folder + "/Settings"), "bplist00 but not quite");
  EXPECT_EQ(std::filesystem::status(onThisMachine(folder)).permissions(),
            std::filesystem::perms::owner_all);
  const nlohmann::json object = onlyObject(result);
  EXPECT_EQ(object["keptInputs"], nlohmann::json::array({folder}));
  ASSERT_EQ(object["warnings"].size(), 1u);
  EXPECT_TRUE(
      result.hasErrorLine("migration-host: warning: " + object["warnings"][0].get<std::string>()));
  EXPECT_NE(result.errors.find(folder), std::string::npos) << result.errors;
}

TEST_F(SafetyNet, ABareRunKeepsNothing) {
  writeText(kSettingsPath, "bplist00 but not quite");

  const ProgramResult result = migrate({"--bare"});

  EXPECT_EQ(result.exitStatus, 0);
  EXPECT_EQ(result.errors, "");
  EXPECT_FALSE(exists(kAccountMigration));
}

TEST_F(SafetyNet, AResultThatIsNotVerifiedChangesNothing) {
  write(kSettingsPath, accountSettings(11));
  const std::string before = readText(kSettingsPath);

  const ProgramResult result = migrateMisbehaving("break the settings");

  EXPECT_EQ(result.exitStatus, 2);
  EXPECT_EQ(result.errors,
            "migration-host: The plug-in reported success but the settings file cannot be read as "
            "a property list; nothing is changed\n");
  EXPECT_EQ(readText(kSettingsPath), before);
  EXPECT_FALSE(exists(kAccountMigration));
  const nlohmann::json object = onlyObject(result);
  EXPECT_EQ(object["result"], true);
  EXPECT_EQ(object["exitStatus"], 2);
}

TEST_F(SafetyNet, AfterAResultThatIsNotVerifiedTheFileIsTheVerySame) {
  write(kSettingsPath, accountSettings(11));
  std::filesystem::permissions(onThisMachine(kSettingsPath), std::filesystem::perms(0640));
  const ino_t before = statusOf(kSettingsPath).st_ino;

  ASSERT_EQ(migrateMisbehaving("break the settings").exitStatus, 2);

  EXPECT_EQ(statusOf(kSettingsPath).st_ino, before);
  EXPECT_EQ(statusOf(kSettingsPath).st_nlink, 1u);
  EXPECT_EQ(statusOf(kSettingsPath).st_mode & 0777, 0640u);
}

TEST_F(SafetyNet, AnInterruptedRemovalBesideOldSettingsIsNotTakenForAMigrationAndSaysWhatToDo) {
  writeText(kSentinelPath, "Old Account Information Removal Sentinel");
  write(kSettingsPath, accountSettings(3));
  write(kLegacyMailPath, legacyMail());

  const ProgramResult result = migrate();

  EXPECT_EQ(result.exitStatus, 2);
  EXPECT_NE(result.errors.find(std::string(kSentinelPath) + " says that"), std::string::npos)
      << result.errors;
  EXPECT_TRUE(exists(kLegacyMailPath));
  EXPECT_TRUE(exists(kSentinelPath));
  std::filesystem::remove(onThisMachine(kSentinelPath));
  EXPECT_EQ(migrate().exitStatus, 0);
  EXPECT_EQ(accountIdentifiers(), std::vector<std::string>{"M"});
}

TEST_F(SafetyNet, AnInterruptedRemovalBesideMigratedSettingsIsFinished) {
  writeText(kSentinelPath, "Old Account Information Removal Sentinel");
  write(kSettingsPath, accountSettings(12));
  write(kLegacyMailPath, PropertyDictionary{{"MailAccounts", PropertyArray{}}});

  EXPECT_EQ(migrate().exitStatus, 0);

  EXPECT_FALSE(exists(kLegacyMailPath));
  EXPECT_FALSE(exists(kAccountMigration));
}

TEST_F(SafetyNet, ALegacyStoreThatCannotBeConvertedIsKept) {
  // A description that is no account: the plug-in converts none of the store and removes it.
  write(kLegacyExchangePath,
        PropertyDictionary{{"DAAccountsKey", PropertyArray{PropertyDictionary{}}}});
  const std::string before = readText(kLegacyExchangePath);

  const ProgramResult result = migrate();

  EXPECT_EQ(result.exitStatus, kNotAllCarriedOver);
  EXPECT_FALSE(exists(kLegacyExchangePath));
  EXPECT_EQ(readText(onlyKeptFolder() + "/LegacyExchange"), before);
}

TEST_F(SafetyNet, AFailureThatChangedNothingLeavesNothing) {
  write(kSettingsPath, accountSettings(11));

  const ProgramResult result = migrateMisbehaving("fail");

  EXPECT_EQ(result.exitStatus, 1);
  EXPECT_EQ(result.errorLines().size(), 1u) << result.errors;
  EXPECT_FALSE(exists(kAccountMigration));
}

TEST_F(SafetyNet, ALegacyStoreThatAFailedOrDeadPluginLostStays) {
  for (const auto& [behaviour, exitStatus] :
       {std::pair("lose mail and fail", 1), std::pair("lose mail and die", 70)}) {
    write(kLegacyMailPath, legacyMail());

    EXPECT_EQ(migrateMisbehaving(behaviour).exitStatus, exitStatus) << behaviour;

    EXPECT_EQ(readDictionary(kLegacyMailPath), legacyMail()) << behaviour;
    EXPECT_FALSE(exists(kAccountMigration)) << behaviour;
  }
}

TEST_F(SafetyNet, AHostThatIsKilledWhileThePluginRunsChangesNothing) {
  write(kSettingsPath, accountSettings(12));
  write(kLegacyMailPath, legacyMail());

  std::array<int, 2> output{};
  ASSERT_EQ(pipe2(output.data(), O_CLOEXEC), 0);
  const pid_t host = startProgram(misbehavingCall("lose mail and wait"), output[1], output[1]);
  close(output[1]);
  EXPECT_EQ(readUntil(output[0], "waiting\n"), Heard::Text);
  kill(host, SIGKILL);
  EXPECT_EQ(waitForEnd(host, std::chrono::seconds(60)), SIGKILL);
  // The worker, which has the other end, too, is gone when that is closed.
  EXPECT_EQ(readUntil(output[0], "more than the worker says"), Heard::End);
  close(output[0]);

  EXPECT_EQ(readDictionary(kLegacyMailPath), legacyMail());
  EXPECT_FALSE(exists(kAccountMigration));
  EXPECT_EQ(migrate().exitStatus, 0);
  EXPECT_EQ(accountIdentifiers(), std::vector<std::string>{"M"});
}

TEST_F(SafetyNet, ACleanRunKeepsTheFilesWhenItIsAskedTo) {
  write(kSettingsPath, accountSettings(11));
  const std::string before = readText(kSettingsPath);

  ASSERT_EQ(migrate({"--keep"}).exitStatus, 0);

  EXPECT_EQ(readText(onlyKeptFolder() + "/Settings"), before);
}

TEST_F(SafetyNet, TheFolderOfAnEarlierRunIsNamedByTheNext) {
  write(kSettingsPath, accountSettings(11));
  ASSERT_EQ(migrate({"--keep"}).exitStatus, 0);
  const std::string folder = onlyKeptFolder();

  const ProgramResult next = migrate({"--json"});

  EXPECT_EQ(next.exitStatus, 0);
  EXPECT_EQ(onlyObject(next)["keptInputs"], nlohmann::json::array({folder}));
  EXPECT_NE(next.errors.find("An earlier run left files in " + folder), std::string::npos)
      << next.errors;
}

TEST_F(SafetyNet, HostsOnOneRootTakeTurns) {
  write(kSettingsPath, accountSettings(11));
  write(kLegacyMailPath, legacyMail());

  std::vector<std::future<ProgramResult>> hosts(6);
  for (std::future<ProgramResult>& host : hosts) {
    host = std::async(std::launch::async, [this] { return migrate(); });
  }

  for (std::future<ProgramResult>& host : hosts) {
    const ProgramResult result = host.get();
    EXPECT_EQ(result.exitStatus, 0) << result.errors;
    EXPECT_EQ(result.errors.find("warning"), std::string::npos) << result.errors;
  }
  EXPECT_EQ(accountIdentifiers(), std::vector<std::string>{"M"});
  EXPECT_FALSE(exists(kAccountMigration));
}

TEST_F(SafetyNet, TemporaryFilesOfAKilledRunAreRemovedByTheNext) {
  write(kSettingsPath, accountSettings(12));
  for (const char* directory : {"/var/mobile/tmp", "/var/mobile/Library/Preferences",
                                "/var/mobile/Library/Logs/CrashReporter/AccountMigration"}) {
    writeText(std::string(directory) + "/.accounts-migration-0123456789abcdef", "half a file");
  }

  ASSERT_EQ(migrate().exitStatus, 0);

  const std::vector<std::string> left = files();
  EXPECT_EQ(std::count_if(left.begin(), left.end(),
                          [](const std::string& path) {
                            return path.find(".accounts-migration-") != std::string::npos;
                          }),
            0);
}

}  // namespace
}  // namespace accounts
