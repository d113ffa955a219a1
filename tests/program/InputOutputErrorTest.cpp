#include <gtest/gtest.h>
#include <unistd.h>

#include "tests/program/DeviceRootFixture.h"
#include "tests/program/DeviceTree.h"
#include "tests/program/ExitStatuses.h"
#include "tests/program/Programs.h"

// Files that the medium does not give: never taken for missing, empty or malformed ones. A
// process's own memory is such a file, since nothing is at its beginning.

namespace accounts {
namespace {

constexpr const char* kUnreadable = "/proc/self/mem";

class UnreadableInput : public DeviceRootFixture,
                        public testing::WithParamInterface<std::vector<std::string>> {};

TEST_P(UnreadableInput, IsAnErrorOfTheMedium) {
  std::vector<std::string> arguments = {GetParam().begin() + 1, GetParam().end()};
  for (std::string& argument : arguments) {
    argument = argument == "ROOT" ? root() : argument;
  }
  const std::string program = GetParam().front();

  const ProgramResult result =
      runProgram({.program = program == "accountsctl" ? accountsctl() : migrationHost(),
                  .arguments = arguments});

  EXPECT_EQ(result.exitStatus, kInputOutputError);
  EXPECT_EQ(result.errors, program + ": Cannot read /proc/self/mem: Input/output error\n");
}

const std::vector<std::string> kUses[] = {
    {"accountsctl", "show", kUnreadable},
    {"accountsctl", "check", kUnreadable},
    {"accountsctl", "convert", kUnreadable, "-", "--to", "xml"},
    {"accountsctl", "diff", kUnreadable, kUnreadable},
    {"accountsctl", "explain", kUnreadable, "A"},
    {"accountsctl", "summarize", kUnreadable},
    {"accountsctl", "summarize", "--roots", kUnreadable, "/dev/null"},
    {"accountsctl", "status", "--root", "ROOT", "--device", kUnreadable},
    {"migration-host", "plan", "--root", "ROOT", "--device", kUnreadable},
    {"migration-host", "run", "--root", "ROOT", "--device", kUnreadable}};

INSTANTIATE_TEST_SUITE_P(Uses, UnreadableInput, testing::ValuesIn(kUses));

class UnreadableStore : public DeviceRootFixture, public testing::WithParamInterface<const char*> {
 protected:
  /// Runs the host where the store stands for the memory of the process that starts it.
  [[nodiscard]] ProgramResult run(const std::string& subcommand) const {
    return runProgram(
        {.program = "unshare",
         .arguments = {"-m", "sh", "-c",
                       "mount --bind /proc/$$/mem \"$0\" || exit 99\n"
                       "\"$1\" \"$2\" --root \"$3\"",
                       onThisMachine(GetParam()).string(), migrationHost(), subcommand, root()}});
  }
};

TEST_P(UnreadableStore, EndsTheRunAndChangesNothing) {
  constexpr int kCannotMount = 99;
  write(kSettingsPath, accountSettings(11));
  write(GetParam(), accountSettings(11));
  // Makes the file of the lock.
  ASSERT_EQ(migrate().exitStatus, 0);
  write(kSettingsPath, accountSettings(11));
  write(GetParam(), accountSettings(11));
  const DeviceTree before = treeOf(root());
  for (const char* const subcommand : {"run", "plan"}) {
    const ProgramResult result = run(subcommand);
    if (getuid() != 0 || result.exitStatus == kCannotMount) {
      GTEST_SKIP() << "This system lets the test mount nothing.";
    }

    EXPECT_EQ(result.exitStatus, kInputOutputError);
    EXPECT_TRUE(result.hasErrorLine("migration-host: Cannot read " + std::string(GetParam()) +
                                    ": Input/output error"))
        << result.errors;
    EXPECT_EQ(treeOf(root()), before);
  }
}

INSTANTIATE_TEST_SUITE_P(Stores, UnreadableStore,
                         testing::Values(kSettingsPath, kLegacyMailPath, kLegacyExchangePath));

}  // namespace
}  // namespace accounts
