#include <gtest/gtest.h>
#include <linux/landlock.h>
#include <sys/stat.h>
#include <sys/syscall.h>
#include <sys/wait.h>
#include <unistd.h>

#include <csignal>
#include <filesystem>
#include <sstream>

#include "platform/linux/Confinement.h"
#include "tests/fakes/Sanitizers.h"
#include "tests/program/DeviceRootFixture.h"
#include "tests/program/DeviceTree.h"
#include "tests/program/ExitStatuses.h"
#include "tests/program/OutsideTree.h"
#include "tests/program/Programs.h"

// In builds that measure coverage this is a function of theirs, in all others nothing.
extern "C" int __llvm_profile_write_file() __attribute__((weak));

namespace accounts {
namespace {

constexpr uid_t kSomeUser = 54321;

/// What a plug-in that wants out can do: tests/program/plugins/EscapingPlugin.cpp, run by whoever
/// runs the test and, where that is the superuser, by somebody else, too.
class Confined : public DeviceRootFixture {
 protected:
  Confined() {
    write(kSettingsPath, accountSettings(12));
    std::filesystem::permissions(onThisMachine("/"), std::filesystem::perms(0755));
    giveTo(kSomeUser);
    // Makes the files of the locks.
    EXPECT_EQ(attempt("nothing", users().back()).exitStatus, 0);
  }

  [[nodiscard]] static std::vector<std::optional<uid_t>> users() {
    std::vector<std::optional<uid_t>> users = {std::nullopt};
    if (getuid() == 0) {
      users.emplace_back(kSomeUser);
    }
    return users;
  }

  [[nodiscard]] ProgramResult attempt(const std::string& name, std::optional<uid_t> user = {},
                                      const std::filesystem::path& victim = {}, pid_t process = 0,
                                      const std::vector<std::string>& further = {}) const {
    std::vector<std::string> arguments = {"--plugin", ESCAPING_BUNDLE, "--json"};
    arguments.insert(arguments.end(), further.begin(), further.end());
    ProgramCall call = migrationCall(arguments);
    call.environment = {{"ATTEMPT", name},
                        {"VICTIM", victim.string()},
                        {"VICTIM_PROCESS", std::to_string(process)}};
    call.user = user;
    return runProgram(call);
  }

  /// Runs accountsctl with decoders that want out: tests/program/plugins/EscapingCodecs.cpp.
  [[nodiscard]] ProgramResult attemptInDecoder(const std::string& name,
                                               std::vector<std::string> arguments,
                                               std::optional<uid_t> user = {},
                                               const std::filesystem::path& victim = {},
                                               pid_t process = 0) const {
    return runProgram({.program = accountsctl(),
                       .arguments = std::move(arguments),
                       .environment = {{"LD_PRELOAD", ESCAPING_CODECS},
                                       {"ATTEMPT", name},
                                       {"VICTIM", victim.string()},
                                       {"VICTIM_PROCESS", std::to_string(process)}},
                       .user = user});
  }

  static void expectEnded(const ProgramResult& result, const std::string& message) {
    EXPECT_EQ(result.exitStatus, kPluginEnded);
    EXPECT_TRUE(result.hasErrorLine("migration-host: The plug-in " + message)) << result.errors;
    EXPECT_EQ(onlyObject(result)["error"], "The plug-in " + message);
  }

  static void expectCommandEnded(const ProgramResult& result, const std::string& message) {
    EXPECT_EQ(result.exitStatus, kPluginEnded);
    EXPECT_EQ(result.errors, "accountsctl: The command " + message + "\n");
    EXPECT_EQ(result.output, "");
  }
};

constexpr const char* kXMLSettings =
    "<plist version=\"1.0\"><dict><key>Accounts</key><array/></dict></plist>";

struct Attempt {
  std::string name;
  /// The system call that it is found out by.
  std::string call;
};

void PrintTo(const Attempt& attempt, std::ostream* stream) {
  *stream << attempt.name;
}

class ForbiddenCall : public Confined, public testing::WithParamInterface<Attempt> {};

TEST_P(ForbiddenCall, EndsTheRunAndChangesNothing) {
  if (kIsExemptFromConfinement) {
    GTEST_SKIP() << "Workers of this build give up no rights.";
  }
  const OutsideTree outside;
  const DeviceTree inside = treeOf(root());
  const auto outsideBefore = outside.contents();
  for (const std::filesystem::path& victim :
       {onThisMachine(kSettingsPath), outside.path(kSettingsPath)}) {
    for (const std::optional<uid_t> user : users()) {
      // A process of the same user, which the kernel itself would let it signal and trace.
      const pid_t process = startProgram({.program = "sleep", .arguments = {"60"}, .user = user},
                                         STDOUT_FILENO, STDERR_FILENO);

      const ProgramResult result = attempt(GetParam().name, user, victim, process);

      expectEnded(result, "made a system call that it may not make: " + GetParam().call);
      EXPECT_EQ(waitpid(process, nullptr, WNOHANG), 0) << "the process ended";
      kill(process, SIGKILL);
      waitpid(process, nullptr, 0);
      EXPECT_EQ(treeOf(root()), inside);
      EXPECT_EQ(outside.contents(), outsideBefore);
    }
  }
}

TEST_P(ForbiddenCall, OfADecoderEndsTheCommandAndChangesNothing) {
  if (kIsExemptFromConfinement) {
    GTEST_SKIP() << "Workers of this build give up no rights.";
  }
  writeText("/settings.xml", kXMLSettings);
  const DeviceTree before = treeOf(root());
  for (const std::optional<uid_t> user : users()) {
    const pid_t process = startProgram({.program = "sleep", .arguments = {"60"}, .user = user},
                                       STDOUT_FILENO, STDERR_FILENO);

    const ProgramResult result =
        attemptInDecoder(GetParam().name, {"show", onThisMachine("/settings.xml").string()}, user,
                         onThisMachine(kSettingsPath), process);

    expectCommandEnded(result, "made a system call that it may not make: " + GetParam().call);
    EXPECT_EQ(waitpid(process, nullptr, WNOHANG), 0) << "the process ended";
    kill(process, SIGKILL);
    waitpid(process, nullptr, 0);
    EXPECT_EQ(treeOf(root()), before);
  }
}

INSTANTIATE_TEST_SUITE_P(All, ForbiddenCall,
                         testing::Values(Attempt{"open", "openat"}, Attempt{"openat2", "openat2"},
                                         Attempt{"create", "openat"}, Attempt{"chmod", "fchmodat"},
                                         Attempt{"chown", "fchownat"},
                                         Attempt{"truncate", "truncate"},
                                         Attempt{"remove", "unlinkat"},
                                         Attempt{"rename", "renameat2"}, Attempt{"exec", "execve"},
                                         Attempt{"fork", "clone"}, Attempt{"socket", "socket"},
                                         Attempt{"ptrace", "ptrace"}, Attempt{"signal", "kill"},
                                         Attempt{"make code", "mmap"},
                                         Attempt{"handle forbidden calls", "rt_sigaction"}),
                         [](const auto& information) {
                           std::string name = information.param.name;
                           std::erase(name, ' ');
                           return name;
                         });

TEST_F(Confined, OnTheDeviceItselfItReachesNoOtherProcess) {
  if (kIsExemptFromConfinement) {
    GTEST_SKIP() << "Workers of this build give up no rights.";
  }
  for (const Attempt& each :
       {Attempt{"exec", "execve"}, Attempt{"ptrace", "ptrace"}, Attempt{"signal", "kill"}}) {
    const pid_t process =
        startProgram({.program = "sleep", .arguments = {"60"}}, STDOUT_FILENO, STDERR_FILENO);

    const ProgramResult result =
        attempt(each.name, {}, onThisMachine(kSettingsPath), process, {"--bare"});

    expectEnded(result, "made a system call that it may not make: " + each.call);
    EXPECT_EQ(waitpid(process, nullptr, WNOHANG), 0) << "the process ended";
    kill(process, SIGKILL);
    waitpid(process, nullptr, 0);
    EXPECT_TRUE(exists(kSettingsPath));
  }
  EXPECT_EQ(attempt("socket", {}, {}, 0, {"--bare"}).exitStatus, kMigrationFailed);
  EXPECT_EQ(attempt("nothing", {}, {}, 0, {"--bare"}).exitStatus, 0);
}

TEST_F(Confined, OnTheDeviceItselfItChangesNoFileOutsideTheRoot) {
  if (kIsExemptFromConfinement) {
    GTEST_SKIP() << "Workers of this build give up no rights.";
  }
  constexpr long kFirstVersionThatIsUsed = 2;
  if (syscall(SYS_landlock_create_ruleset, nullptr, 0, LANDLOCK_CREATE_RULESET_VERSION) <
      kFirstVersionThatIsUsed) {
    GTEST_SKIP() << "This kernel has no Landlock, or too old a one.";
  }
  const OutsideTree outside;
  const auto before = outside.contents();
  for (const char* const name : {"create", "truncate", "remove", "rename"}) {
    EXPECT_EQ(attempt(name, {}, outside.path(kSettingsPath), 0, {"--bare"}).exitStatus,
              kMigrationFailed)
        << name;
    EXPECT_EQ(outside.contents(), before) << name;
    write(kSettingsPath, accountSettings(12));
    EXPECT_EQ(attempt(name, {}, onThisMachine(kSettingsPath), 0, {"--bare"}).exitStatus, 0) << name;
  }
}

TEST_F(Confined, TheNewCallForThreadsAndProcessesDoesNotExist) {
  if (kIsExemptFromConfinement) {
    GTEST_SKIP() << "Workers of this build give up no rights.";
  }
  EXPECT_EQ(attempt("clone3").exitStatus, 0);
}

TEST_F(Confined, MemoryWithoutEndEndsTheRun) {
  if (kIsExemptFromConfinement) {
    GTEST_SKIP() << "Workers of this build give up no rights.";
  }
  const DeviceTree before = treeOf(root());
  for (const std::optional<uid_t> user : users()) {
    expectEnded(attempt("memory", user),
                "needs more than the 256 MiB of memory that files of this size allow it");
    EXPECT_EQ(treeOf(root()), before);
  }
}

TEST_F(Confined, ProcessorTimeWithoutEndEndsTheRun) {
  if (kIsExemptFromConfinement) {
    GTEST_SKIP() << "Workers of this build give up no rights.";
  }
  const DeviceTree before = treeOf(root());
  for (const std::optional<uid_t> user : users()) {
    expectEnded(attempt("time", user),
                "needs more than the 5 s of processor time that files of this size allow it");
    EXPECT_EQ(treeOf(root()), before);
  }
}

TEST_F(Confined, TheSuperusersWorkerIsNobody) {
  if (getuid() != 0 || kIsExemptFromConfinement) {
    GTEST_SKIP() << "Only the superuser's worker becomes somebody else, and only where confined.";
  }
  EXPECT_TRUE(attempt("show user").hasErrorLine("user 65534, group 65534"));
}

TEST_F(Confined, NoDirectoryIsOpen) {
  if (kIsExemptFromConfinement) {
    GTEST_SKIP() << "Workers of this build give up no rights.";
  }
  const ProgramResult result = attempt("show descriptors");

  std::ostringstream directory;
  directory << "descriptor of kind " << std::oct << S_IFDIR;
  EXPECT_EQ(result.exitStatus, 0);
  EXPECT_NE(result.errors.find("descriptor of kind "), std::string::npos);
  EXPECT_FALSE(result.hasErrorLine(directory.str())) << result.errors;
}

TEST_F(Confined, SoAreTheDecodersOfEveryCommandOfAccountsctl) {
  if (kIsExemptFromConfinement) {
    GTEST_SKIP() << "Workers of this build give up no rights.";
  }
  writeText(kSettingsPath, kXMLSettings);
  writeText("/report.json", "{}");
  const std::string settings = onThisMachine(kSettingsPath).string();
  const std::string report = onThisMachine("/report.json").string();
  const std::string made = onThisMachine("/made").string();
  giveTo(kSomeUser);
  const DeviceTree before = treeOf(root());
  const std::vector<std::string> commands[] = {{"show", settings},
                                               {"diff", settings, settings},
                                               {"check", settings},
                                               {"status", "--root", root()},
                                               {"convert", settings, made, "--to", "binary"},
                                               {"explain", report, "A"},
                                               {"summarize", report, "--html", made}};
  for (const std::vector<std::string>& command : commands) {
    for (const std::optional<uid_t> user : users()) {
      SCOPED_TRACE(command.front());
      expectCommandEnded(attemptInDecoder("open", command, user, settings),
                         "made a system call that it may not make: openat");
      EXPECT_EQ(treeOf(root()), before);
    }
    const ProgramResult shown = attemptInDecoder("show descriptors", command);
    std::ostringstream directory;
    directory << "descriptor of kind " << std::oct << S_IFDIR;
    EXPECT_NE(shown.output.find("descriptor of kind "), std::string::npos);
    EXPECT_EQ(shown.output.find(directory.str()), std::string::npos) << shown.output;
    if (getuid() == 0) {
      EXPECT_NE(attemptInDecoder("show user", command).output.find("user 65534, group 65534"),
                std::string::npos);
    }
    std::filesystem::remove(made);
  }
}

TEST_F(Confined, ADecoderHasAnEndOfMemoryAndOfProcessorTime) {
  if (kIsExemptFromConfinement) {
    GTEST_SKIP() << "Workers of this build give up no rights.";
  }
  writeText("/settings.xml", kXMLSettings);
  const std::string settings = onThisMachine("/settings.xml").string();

  expectCommandEnded(attemptInDecoder("memory", {"show", settings}),
                     "needs more than the 256 MiB of memory that files of this size allow it");
  expectCommandEnded(attemptInDecoder("time", {"show", settings}),
                     "needs more than the 5 s of processor time that files of this size allow it");
}

TEST_F(Confined, AMigrationLoadsNoFramework) {
  const ProgramResult result = attempt("framework");

  EXPECT_EQ(result.exitStatus, 0);
  EXPECT_TRUE(result.hasErrorLine("A migration loads no framework: /framework.so"))
      << result.errors;
}

TEST_F(Confined, OnlyBuildsWithSanitizersOrForCoverageAreExempt) {
  const bool isInstrumented = kWithSanitizers || __llvm_profile_write_file != nullptr;

  EXPECT_EQ(kIsExemptFromConfinement, isInstrumented);
  EXPECT_EQ(attempt("open", {}, onThisMachine(kSettingsPath)).exitStatus,
            isInstrumented ? 0 : kPluginEnded);
}

}  // namespace
}  // namespace accounts
