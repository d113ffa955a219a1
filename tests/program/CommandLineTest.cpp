#include <gtest/gtest.h>

#include "tests/program/DeviceRootFixture.h"
#include "tests/program/ExitStatuses.h"
#include "tests/program/Programs.h"

namespace accounts {
namespace {

ProgramResult runHost(const std::vector<std::string>& arguments) {
  return runProgram({.program = migrationHost(), .arguments = arguments});
}

/// The arguments are refused with one clear line that names what is wrong, and nothing else.
void expectRefused(const std::vector<std::string>& arguments, const std::string& naming) {
  const ProgramResult result = runHost(arguments);

  EXPECT_EQ(result.exitStatus, kUnusableArguments);
  EXPECT_EQ(result.output, "");
  ASSERT_EQ(result.errorLines().size(), 1U) << result.errors;
  EXPECT_TRUE(result.errors.starts_with("migration-host: ")) << result.errors;
  EXPECT_NE(result.errors.find(naming), std::string::npos) << result.errors;
}

/// The arguments ask for a text, which comes on standard output alone.
std::string textFor(const std::vector<std::string>& arguments) {
  const ProgramResult result = runHost(arguments);
  EXPECT_EQ(result.exitStatus, 0);
  EXPECT_EQ(result.errors, "");
  return result.output;
}

TEST(CommandLine, NoArgumentsAreRefused) {
  expectRefused({}, "subcommand");
}

TEST(CommandLine, AnUnknownSubcommandIsRefused) {
  expectRefused({"walk"}, "walk");
}

TEST(CommandLine, RunWithoutARootIsRefused) {
  expectRefused({"run"}, "--root");
}

TEST(CommandLine, ARootWithoutADirectoryIsRefused) {
  expectRefused({"run", "--root"}, "--root");
}

TEST(CommandLine, AnEmptyRootIsRefused) {
  expectRefused({"run", "--root", ""}, "--root");
}

TEST(CommandLine, TwoRootsAreRefused) {
  expectRefused({"run", "--root", "/a", "--root", "/b"}, "--root");
}

TEST(CommandLine, AnUnknownOptionIsRefused) {
  expectRefused({"run", "--root", "/nowhere", "--rot13"}, "--rot13");
}

TEST(CommandLine, AMisspeltWordIsNamedWithTheOneThatWasMeant) {
  expectRefused({"rum"}, "did you mean 'run'?");
  expectRefused({"plan", "--root", "/nowhere", "--htlm", "x"}, "did you mean '--html'?");
}

TEST(CommandLine, EveryRefusalIsInTheProgramsOwnWords) {
  expectRefused({"run"}, ": --root DIR is needed (");
  expectRefused({"run", "--root"}, ": The DIR of --root is missing (");
  expectRefused({"run", "--root", "/a", "--root", "/b"}, ": --root is given more than once (");
  expectRefused({"--root", "/nowhere", "run"}, ": --root has to stand behind run (");
  expectRefused({"run", "--root", "/nowhere", "--lock-timeout", "99999999999"},
                ": --lock-timeout: must be a whole number, at most 999999999 (");
  expectRefused({"run", "--root", "/nowhere", "--lock-timeout", "soon"},
                ": --lock-timeout: must be a whole number, at most 999999999 (");
  expectRefused({"run", "--root", "/nowhere", "--broadcast", "radio"},
                ": --broadcast: must be dbus (");
  expectRefused({"run", "--root", "/nowhere", "--report"}, ": The FILE of --report is missing (");
}

TEST(CommandLine, PlanIsRefusedWhereRunIs) {
  expectRefused({"plan"}, "--root");
  expectRefused({"plan", "--root", ""}, "--root");
  expectRefused({"plan", "--root", "/nowhere", "--bare"}, "--bare");
}

TEST(CommandLine, HelpOfPlanNamesEveryOption) {
  const std::string help = textFor({"plan", "--help"});

  for (const char* option : {"--root", "--home", "--device", "--plugin", "--temporary-directory",
                             "--channel", "--report", "--html", "--show-secrets", "--json"}) {
    EXPECT_NE(help.find(option), std::string::npos) << option;
  }
}

TEST(CommandLine, AStrayArgumentIsRefused) {
  expectRefused({"run", "--root", "/nowhere", "stray"}, "stray");
}

TEST(CommandLine, AHomeThatIsNoDevicePathIsRefused) {
  expectRefused({"run", "--root", "/nowhere", "--home", "var/mobile"}, "--home");
}

TEST(CommandLine, ATemporaryDirectoryThatIsNoDevicePathIsRefused) {
  expectRefused({"run", "--root", "/nowhere", "--temporary-directory", "tmp"},
                "--temporary-directory");
}

TEST(CommandLine, AnArgumentWithALineBreakStillGivesOneLine) {
  expectRefused({"run", "--root", "/nowhere", "--home", "a\nb"}, "--home");
}

TEST(CommandLine, WithJSONARefusalIsOneObjectAsWell) {
  const ProgramResult result = runHost({"run", "--json"});

  EXPECT_EQ(result.exitStatus, kUnusableArguments);
  EXPECT_EQ(result.errorLines().size(), 1U) << result.errors;
  const nlohmann::json object = onlyObject(result);
  EXPECT_EQ(object["result"], false);
  EXPECT_EQ(object["exitStatus"], kUnusableArguments);
  EXPECT_NE(object["error"].get<std::string>().find("--root"), std::string::npos);
}

TEST(CommandLine, ARefusedRunTouchesNothing) {
  const std::filesystem::path root =
      std::filesystem::temp_directory_path() / "migration-host-refused-run";
  std::filesystem::remove_all(root);

  runHost({"run", "--root", root.string(), "--home", "relative"});

  EXPECT_FALSE(std::filesystem::exists(root));
}

TEST(CommandLine, HelpOfTheProgramNamesItsSubcommandsAndExamples) {
  const std::string help = textFor({"--help"});

  EXPECT_NE(help.find("run"), std::string::npos);
  EXPECT_NE(help.find("migration-host run --root /mnt/image"), std::string::npos);
  EXPECT_NE(help.find("migration-host restore --root /mnt/image"), std::string::npos);
}

TEST(CommandLine, HelpOfRunNamesEveryOption) {
  const std::string help = textFor({"run", "--help"});

  for (const char* expected : {"--root", "--home", "--device", "--plugin", "--temporary-directory",
                               "--channel", "--json", "--bare", "Exit status:", "Examples:"}) {
    EXPECT_NE(help.find(expected), std::string::npos) << expected;
  }
}

TEST(CommandLine, HelpOfRestoreNamesEveryOption) {
  const std::string help = textFor({"restore", "--help"});

  for (const char* expected :
       {"--root", "--home", "--from", "--json", "Exit status:", "Examples:"}) {
    EXPECT_NE(help.find(expected), std::string::npos) << expected;
  }
}

TEST(CommandLine, RestoreIsRefusedWhereRunIs) {
  expectRefused({"restore"}, "--root");
  expectRefused({"restore", "--root", ""}, "--root");
  expectRefused({"restore", "--root", "/nowhere", "--from", ""}, "--from");
  expectRefused({"restore", "--root", "/nowhere", "--home", "var/mobile"}, "--home");
  expectRefused({"restore", "--root", "/nowhere", "--bare"}, "--bare");
}

TEST(CommandLine, TwoSubcommandsAreRefused) {
  expectRefused({"run", "--root", "/nowhere", "restore"}, "restore");
}

TEST(CommandLine, TheProgramAndRunTellTheSameVersion) {
  const std::string version = textFor({"--version"});

  EXPECT_TRUE(version.starts_with("migration-host ")) << version;
  EXPECT_TRUE(version.ends_with("\n")) << version;
  EXPECT_EQ(textFor({"run", "--version"}), version);
}

}  // namespace
}  // namespace accounts
