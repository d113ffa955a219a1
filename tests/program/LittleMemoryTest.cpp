#include <gtest/gtest.h>

#include <filesystem>
#include <iostream>

#include "propertylist/xml/XMLPropertyList.h"
#include "tests/fakes/Sanitizers.h"
#include "tests/program/DeviceRootFixture.h"
#include "tests/program/DeviceTree.h"
#include "tests/program/ExitStatuses.h"
#include "tests/program/Programs.h"

// Every program and subcommand with ever more memory, and with ever more descriptors, from too
// little to start to enough, and with little stack.

namespace accounts {
namespace {

constexpr std::uint64_t kKibibyte = 1024;
/// Between two limits that are tried.
constexpr std::uint64_t kLimitStep = 192 * kKibibyte;
constexpr int kMostSteps = 400;
constexpr int kAccounts = 400;

enum class Format : std::uint8_t { XML, Binary };

struct Use {
  std::string name;
  bool isHost = false;
  /// ROOT, FILE and REPORT stand for the device's root, its settings file and a plan of it.
  std::vector<std::string> arguments;
};

void PrintTo(const Use& use, std::ostream* stream) {
  *stream << use.name;
}

class LittleMemory : public DeviceRootFixture,
                     public testing::WithParamInterface<std::tuple<Use, Format>> {
 protected:
  LittleMemory() : DeviceRootFixture(Medium::Memory) { prepare(); }

  [[nodiscard]] static bool isOf(std::string_view subcommand) {
    return std::get<Use>(GetParam()).arguments.front() == subcommand;
  }

  /// Makes the device as it is before a use: for restoring, with files that a run kept.
  void prepare() const {
    std::filesystem::remove_all(onThisMachine("/var/mobile/Library/AccountMigration"));
    makeSettings();
    if (isOf("restore")) {
      EXPECT_EQ(migrate({"--keep"}).exitStatus, 0);
    } else if (isOf("summarize") || isOf("explain")) {
      const ProgramResult plan = runProgram(
          {.program = migrationHost(), .arguments = {"plan", "--root", root(), "--json"}});
      EXPECT_EQ(plan.exitStatus, 0);
      writeText("/report.json", plan.output);
    }
  }

  void makeSettings() const {
    PropertyArray accounts;
    for (int number = 0; number < kAccounts; ++number) {
      accounts.append(PropertyDictionary{{"Type", "CalDAV"},
                                         {"Class", "CalDAVAccount"},
                                         {"Identifier", "ID" + std::to_string(number)},
                                         {"Username", "user" + std::to_string(number)},
                                         {"Notes", std::string(1000, 'n')}});
    }
    const PropertyDictionary settings = accountSettings(11, std::move(accounts));
    if (std::get<Format>(GetParam()) == Format::Binary) {
      write(kSettingsPath, settings);
    } else {
      writeText(kSettingsPath, writeXMLPropertyList(settings).value());
    }
  }

  [[nodiscard]] ProgramCall call(std::optional<std::uint64_t> memory) const {
    const Use& use = std::get<Use>(GetParam());
    ProgramCall call = {.program = use.isHost ? migrationHost() : accountsctl(),
                        .arguments = use.arguments,
                        .memory = memory};
    for (std::string& argument : call.arguments) {
      if (argument == "ROOT") {
        argument = root();
      } else if (argument == "FILE") {
        argument = onThisMachine(kSettingsPath).string();
      } else if (argument == "REPORT") {
        argument = onThisMachine("/report.json").string();
      }
    }
    return call;
  }

  [[nodiscard]] static bool takesLittle() {
    return std::get<Format>(GetParam()) == Format::Binary || isOf("restore");
  }

  [[nodiscard]] static bool changesTheDevice() {
    return isOf("run") || (isOf("restore") && std::get<Use>(GetParam()).name != "RestoreList");
  }

  [[nodiscard]] static bool isBare() { return std::get<Use>(GetParam()).name == "BareRun"; }

  /// A bare run saves each step by itself, and begins where it ended.
  void expectNothingChanged(const std::string& before) const {
    if (isBare()) {
      prepare();
    } else {
      EXPECT_EQ(readText(kSettingsPath), before);
    }
  }

  /// Whether the use puts kept files back.
  [[nodiscard]] static bool isPutBack() { return std::get<Use>(GetParam()).name == "Restore"; }

  static void expectOneClearLine(const ProgramResult& result, std::string_view cause) {
    EXPECT_EQ(result.exitStatus, kMayPass) << result.errors;
    std::size_t lines = 0;
    for (const std::string& line : result.errorLines()) {
      const bool isOfTheProgram =
          line.starts_with("migration-host: ") || line.starts_with("accountsctl: ");
      lines += isOfTheProgram ? 1 : 0;
      EXPECT_TRUE(!isOfTheProgram || line.find(cause) != std::string::npos) << line;
    }
    EXPECT_EQ(lines, 1u) << result.errors;
  }

  /// The least memory with which the program starts: the system's own loader speaks before.
  [[nodiscard]] std::uint64_t leastMemory() const {
    std::uint64_t memory = 4096 * kKibibyte;
    ProgramCall version = call(memory);
    version.arguments = {"--version"};
    while (runProgram(version).exitStatus != 0) {
      memory += kLimitStep;
      version.memory = memory;
    }
    return memory;
  }

  /// A call with what the shell's ulimit sets.
  static ProgramCall withLimit(const std::string& limit, ProgramCall call) {
    call.arguments.insert(call.arguments.begin(),
                          {"-c", "ulimit " + limit + "; exec \"$0\" \"$@\"", call.program});
    call.program = "sh";
    return call;
  }
  /// A call with a number of descriptors, the standard streams included.
  static ProgramCall withDescriptors(int count, ProgramCall call) {
    return withLimit("-n " + std::to_string(count), std::move(call));
  }
  /// The fewest descriptors with which the program starts: the loader speaks before.
  [[nodiscard]] int fewestDescriptors() const {
    constexpr int kStandardStreams = 3;
    ProgramCall version = call(std::nullopt);
    version.arguments = {"--version"};
    int count = kStandardStreams;
    while (runProgram(withDescriptors(count, version)).exitStatus != 0) {
      ++count;
    }
    return count;
  }
};

TEST_P(LittleMemory, EndsWithOneClearLineOrAsWithEnough) {
  if (kWithSanitizers) {
    GTEST_SKIP() << "Sanitizers take address space without end.";
  }
  const ProgramResult enough = runProgram(call(std::nullopt));
  if (changesTheDevice()) {
    prepare();
  }
  const std::string before = readText(kSettingsPath);
  std::uint64_t memory = leastMemory();
  int failures = 0;
  for (int step = 0; step < kMostSteps; ++step, memory += kLimitStep) {
    const ProgramResult result = runProgram(call(memory));
    if (result.exitStatus == enough.exitStatus) {
      if (!changesTheDevice() && !isOf("plan")) {
        EXPECT_EQ(result.output, enough.output);
      }
      EXPECT_EQ(readText(kSettingsPath) != before, isOf("run") || isPutBack());
      std::cout << failures << " limits too low\n";
      // Some take no more than starting.
      EXPECT_TRUE(failures > 0 || takesLittle());
      return;
    }
    ++failures;
    SCOPED_TRACE(std::to_string(memory / kKibibyte) + " KiB");
    expectOneClearLine(result, "memory");
    expectNothingChanged(before);
    if (HasFailure()) {
      return;
    }
  }
  ADD_FAILURE() << "no limit was enough";
}

TEST_P(LittleMemory, SoItIsWithFewDescriptors) {
  if (kWithSanitizers) {
    GTEST_SKIP() << "Sanitizers take descriptors of their own.";
  }
  if (isBare()) {
    GTEST_SKIP() << "What a bare run cannot open is missing for the plug-in.";
  }
  constexpr int kMostDescriptors = 64;
  const ProgramResult enough = runProgram(call(std::nullopt));
  if (changesTheDevice()) {
    prepare();
  }
  const std::string before = readText(kSettingsPath);
  for (int count = fewestDescriptors(); count < kMostDescriptors; ++count) {
    SCOPED_TRACE(std::to_string(count) + " descriptors");

    const ProgramResult result = runProgram(withDescriptors(count, call(std::nullopt)));

    if (result.exitStatus == enough.exitStatus) {
      if (!changesTheDevice() && !isOf("plan")) {
        EXPECT_EQ(result.output, enough.output);
      }
      EXPECT_EQ(readText(kSettingsPath) != before, isOf("run") || isPutBack());
      return;
    }
    expectOneClearLine(result, "Too many open files");
    expectNothingChanged(before);
    if (HasFailure()) {
      return;
    }
  }
  ADD_FAILURE() << "no limit was enough";
}

TEST_P(LittleMemory, TheStackIsAskedForThatIsNeeded) {
  if (kWithSanitizers) {
    GTEST_SKIP() << "Sanitizers take stack of their own.";
  }
  const std::string before = readText(kSettingsPath);
  const ProgramResult enough = runProgram(call(std::nullopt));
  if (changesTheDevice()) {
    prepare();
  }

  const ProgramResult result = runProgram(withLimit("-S -s 64", call(std::nullopt)));

  EXPECT_EQ(result.exitStatus, enough.exitStatus) << result.errors;
  EXPECT_EQ(readText(kSettingsPath) != before, isOf("run") || isPutBack());
  // More than is allowed is given to the superuser at most.
  ProgramCall refused = withLimit("-s 64", call(std::nullopt));
  refused.user = kSomebody;
  expectOneClearLine(runProgram(refused), "stack");
}

INSTANTIATE_TEST_SUITE_P(
    Uses, LittleMemory,
    testing::Combine(
        testing::Values(Use{"Run", true, {"run", "--root", "ROOT"}},
                        Use{"BareRun", true, {"run", "--root", "ROOT", "--bare"}},
                        Use{"Plan", true, {"plan", "--root", "ROOT"}},
                        Use{"PlanAsJSON", true, {"plan", "--root", "ROOT", "--json"}},
                        Use{"Restore", true, {"restore", "--root", "ROOT"}},
                        Use{"RestoreList", true, {"restore", "--root", "ROOT", "--list"}},
                        Use{"Discard", true, {"restore", "--root", "ROOT", "--discard"}},
                        Use{"Show", false, {"show", "FILE"}},
                        Use{"ShowAsJSON", false, {"show", "FILE", "--json"}},
                        Use{"Check", false, {"check", "FILE"}},
                        Use{"Convert", false, {"convert", "FILE", "-", "--to", "xml"}},
                        Use{"Diff", false, {"diff", "FILE", "FILE"}},
                        Use{"Status", false, {"status", "--root", "ROOT"}},
                        Use{"Summarize", false, {"summarize", "REPORT"}},
                        Use{"Explain", false, {"explain", "REPORT", "ID7"}}),
        testing::Values(Format::XML, Format::Binary)),
    [](const auto& information) {
      return std::get<Use>(information.param).name +
             (std::get<Format>(information.param) == Format::XML ? "OfXML" : "OfBinary");
    });

}  // namespace
}  // namespace accounts
