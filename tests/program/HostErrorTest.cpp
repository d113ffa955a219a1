#include <filesystem>

#include "tests/program/DeviceRootFixture.h"
#include "tests/program/ExitStatuses.h"
#include "tests/program/Programs.h"

namespace accounts {
namespace {

/// Errors of the host's own, with a device that a migration would change.
class HostError : public DeviceRootFixture {
 protected:
  HostError() { write(kSettingsPath, accountSettings(11)); }

  /// The run ends with this status and one line that names the cause, and the device is untouched.
  void expectUntouched(const std::vector<std::string>& arguments, int exitStatus,
                       const std::string& naming) {
    const std::vector<std::string> filesBefore = files();
    const std::string settingsBefore = readText(kSettingsPath);

    const ProgramResult result = migrate(arguments);

    EXPECT_EQ(result.exitStatus, exitStatus);
    EXPECT_EQ(result.output, "");
    ASSERT_EQ(result.errorLines().size(), 1U) << result.errors;
    EXPECT_TRUE(result.errors.starts_with("migration-host: ")) << result.errors;
    EXPECT_NE(result.errors.find(naming), std::string::npos) << result.errors;
    std::vector<std::string> filesAfter = files();
    // A lock's file is made before anything else and never removed.
    std::erase(filesAfter, kLockPath);
    EXPECT_EQ(filesAfter, filesBefore);
    EXPECT_EQ(readText(kSettingsPath), settingsBefore);
  }
};

TEST_F(HostError, ARootWithoutAnyDirectoryOfADeviceIsTakenForAnImageThatIsNotMounted) {
  const std::string empty = onThisMachine("/mnt").string();
  std::filesystem::create_directory(empty);

  for (const char* command : {"run", "plan"}) {
    const ProgramResult result =
        runProgram({.program = migrationHost(), .arguments = {command, "--root", empty}});

    EXPECT_EQ(result.exitStatus, kMissingInput) << command;
    EXPECT_EQ(result.errors, "migration-host: " + empty +
                                 " has none of the directories that every device has "
                                 "(/var/mobile, /etc, /tmp): is the image mounted?\n");
  }
  EXPECT_TRUE(std::filesystem::is_empty(empty));
}

TEST_F(HostError, AMissingRootIsNamed) {
  const std::string missing = onThisMachine("/missing").string();

  const ProgramResult result =
      runProgram({.program = migrationHost(), .arguments = {"run", "--root", missing}});

  EXPECT_EQ(result.exitStatus, kMissingInput);
  ASSERT_EQ(result.errorLines().size(), 1U) << result.errors;
  EXPECT_NE(result.errors.find(missing), std::string::npos) << result.errors;
}

TEST_F(HostError, ARootThatIsAFileIsNoRoot) {
  const std::string file = onThisMachine(kSettingsPath).string();

  const ProgramResult result =
      runProgram({.program = migrationHost(), .arguments = {"run", "--root", file}});

  EXPECT_EQ(result.exitStatus, kMissingInput);
  EXPECT_EQ(result.errorLines().size(), 1U) << result.errors;
}

TEST_F(HostError, AMissingRootIsReportedAsAnObjectToo) {
  const std::string missing = onThisMachine("/missing").string();

  const ProgramResult result =
      runProgram({.program = migrationHost(), .arguments = {"run", "--root", missing, "--json"}});

  const nlohmann::json object = onlyObject(result);
  EXPECT_EQ(object["root"], missing);
  EXPECT_EQ(object["result"], false);
  EXPECT_EQ(object["broadcasts"], nlohmann::json::array());
  EXPECT_EQ(object["cloudTabAnnouncements"], 0);
  EXPECT_EQ(object["exitStatus"], kMissingInput);
  EXPECT_TRUE(object["error"].is_string());
}

TEST_F(HostError, ANamedDeviceDescriptionMustExist) {
  expectUntouched({"--device", onThisMachine("/missing.plist").string()}, kMissingInput,
                  "missing.plist");
}

TEST_F(HostError, ANamedDeviceDescriptionMustBeReadable) {
  writeText("/broken.plist", "this is no property list");

  expectUntouched({"--device", onThisMachine("/broken.plist").string()}, kMissingInput,
                  "broken.plist");
}

TEST_F(HostError, ADeviceDescriptionMustBeADictionary) {
  write("/array.plist", PropertyArray{"CPUArchitecture"});

  expectUntouched({"--device", onThisMachine("/array.plist").string()}, kMissingInput,
                  "array.plist");
}

TEST_F(HostError, TheRootsOwnDeviceDescriptionMustBeReadable) {
  writeText(kDevicePropertyListPath, "<plist><dict>");

  expectUntouched({}, kMissingInput, "device.plist");
}

TEST_F(HostError, TheRootsOwnDeviceDescriptionMayBeMissing) {
  EXPECT_EQ(migrate().exitStatus, 0);
}

TEST_F(HostError, AMissingBundleIsNamed) {
  expectUntouched({"--plugin", onThisMachine("/other.migrator").string()}, kMissingInput,
                  "other.migrator");
}

TEST_F(HostError, ABundleWithoutAPluginIsNamed) {
  std::filesystem::create_directory(onThisMachine("/empty.migrator"));

  expectUntouched({"--plugin", onThisMachine("/empty.migrator").string()}, kMissingInput,
                  "empty.migrator");
}

TEST_F(HostError, APluginThatIsNoSharedObjectCannotBeLoaded) {
  writeText("/broken.migrator/AccountsDataMigrator.so", "no shared object");
  std::filesystem::create_directory(onThisMachine("/broken.migrator/Resources"));

  expectUntouched({"--plugin", onThisMachine("/broken.migrator").string()}, kMissingInput,
                  "broken.migrator");
}

TEST_F(HostError, APluginWithoutAnEntryPointCannotBeLoaded) {
  expectUntouched({"--plugin", EMPTY_BUNDLE}, kMissingInput, "CreateMigrationPlugin");
}

TEST_F(HostError, APluginOfOtherHeadersIsNotCalled) {
  expectUntouched({"--plugin", OTHER_HEADERS_BUNDLE}, kMissingInput,
                  "AccountsDataMigrator.so: It was built against other headers: its interface has "
                  "version 999, which is ");
}

TEST_F(HostError, AChannelThatCannotBeCreatedIsNamed) {
  expectUntouched({"--channel", onThisMachine("/missing/channel.log").string()}, kCannotCreate,
                  "channel.log");
}

TEST_F(HostError, AFullStandardOutputIsAnError) {
  ProgramCall call = migrationCall({"--json"});
  call.outputFile = "/dev/full";

  const ProgramResult result = runProgram(call);

  EXPECT_EQ(result.exitStatus, kInputOutputError);
  EXPECT_TRUE(
      result.hasErrorLine("migration-host: The result cannot be written to standard output"))
      << result.errors;
}

}  // namespace
}  // namespace accounts
