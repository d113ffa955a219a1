#include <gtest/gtest.h>

#include <filesystem>

#include "propertylist/value/GeneralisedUTF8.h"
#include "tests/program/DeviceRootFixture.h"
#include "tests/program/ExitStatuses.h"
#include "tests/program/Programs.h"

// Control characters and marks that reorder text, in every name and text that a command may meet:
// none reaches a terminal or a line of JSON as it is.

namespace accounts {
namespace {

constexpr const char* kMarksInXML = "\x7f\u0080\u009b\u2028\u2029\u202a\u202e\u2066\u2069";
constexpr const char* kMarks =
    "\x01\x1b[2J\x7f\u0080\u009b\u2028\u2029"
    "\u202a\u202b\u202c\u202d\u202e\u2066\u2067\u2068\u2069.";

struct Command {
  /// The first is the program. ROOT stands for the device's root and MARKS for all marks.
  std::vector<std::string> words;
  int exitStatus = 0;
};

void PrintTo(const Command& command, std::ostream* stream) {
  for (const std::string& word : command.words) {
    *stream << word << ' ';
  }
}

/// What a text has that may not stand there, line ends and the tabs of tables aside.
std::vector<std::uint32_t> marksIn(std::string_view text) {
  std::vector<std::uint32_t> marks;
  while (!text.empty()) {
    const DecodedCodePoint decoded = decodeCodePoint(text);
    if (isControlOrReordering(decoded.value) && decoded.value != '\n' && decoded.value != '\t') {
      marks.push_back(decoded.value);
    }
    text.remove_prefix(std::max<std::size_t>(decoded.length, 1));
  }
  return marks;
}

/// A device whose root is named by the marks, and so is all that its stores hold.
class HostileMarks : public DeviceRootFixture, public testing::WithParamInterface<Command> {
 protected:
  HostileMarks() : DeviceRootFixture(Medium::Memory) {
    std::filesystem::create_directories(markedRoot());
    for (const char* const directory : {"etc", "tmp", "var"}) {
      std::filesystem::rename(onThisMachine("/") / directory, markedRoot() / directory);
    }
    const PropertyDictionary account = {{"Identifier", kMarks},
                                        {"Type", "CalDAV"},
                                        {"Class", kMarks},
                                        {"uniqueId", kMarks},
                                        {"AccountType", kMarks},
                                        {"Username", kMarks},
                                        {"DisplayName", kMarks},
                                        {"Enabled Dataclasses", PropertyArray{kMarks}},
                                        {kMarks, PropertyArray{kMarks}}};
    write(marked(kSettingsPath), accountSettings(3, {account, account}));
    write(marked(kLegacyMailPath),
          PropertyDictionary{{"MailAccounts", PropertyArray{account}}, {kMarks, kMarks}});
    write(marked("/settings"), accountSettings(3, {account}));
    // XML has no control characters below a blank.
    write(marked("/in-xml"), PropertyDictionary{{kMarksInXML, PropertyArray{kMarksInXML}}});
    write(marked("/other"), PropertyDictionary{{kMarks, PropertyArray{kMarks, true}}});
    std::filesystem::create_directories(markedRoot() / "var/mobile/Library/AccountMigration" /
                                        (std::string("Kept-") + kMarks));
  }

  static std::string marked(std::string_view path) { return "/" + (kMarks + std::string(path)); }
  [[nodiscard]] std::filesystem::path markedRoot() const { return onThisMachine(marked("")); }

  [[nodiscard]] ProgramResult run(const std::vector<std::string>& words) const {
    ProgramCall call = {.program = words.front() == "accountsctl" ? accountsctl() : migrationHost(),
                        .arguments = {words.begin() + 1, words.end()}};
    for (std::string& word : call.arguments) {
      for (const auto& [name, meaning] :
           {std::pair<std::string, std::string>{"ROOT", markedRoot().string()},
            {"MARKS", kMarks}}) {
        if (const std::size_t place = word.find(name); place != word.npos) {
          word.replace(place, name.size(), meaning);
        }
      }
    }
    return runProgram(call);
  }
};

TEST_P(HostileMarks, AreNeverWrittenAsTheyAre) {
  ASSERT_EQ(run({"migration-host", "plan", "--root", "ROOT", "--report", "ROOT/report"}).exitStatus,
            kNotAllCarriedOver);

  const ProgramResult result = run(GetParam().words);

  EXPECT_EQ(result.exitStatus, GetParam().exitStatus) << result.errors;
  EXPECT_EQ(marksIn(result.output), std::vector<std::uint32_t>()) << result.output;
  EXPECT_EQ(marksIn(result.errors), std::vector<std::uint32_t>()) << result.errors;
  EXPECT_NE(result.output + result.errors, "") << "There is nothing to look at.";
}

/// Standard error, where warnings go, is not always seen.
class ClosedErrors : public DeviceRootFixture, public testing::WithParamInterface<const char*> {
 protected:
  ClosedErrors() {
    write(kSettingsPath, accountSettings(11, {PropertyDictionary{{"Identifier", "A"}}}));
  }

  [[nodiscard]] ProgramResult run(const std::string& form) const {
    return runProgram({.program = "sh",
                       .arguments = {"-c", "exec \"$0\" \"$1\" --root \"$2\" " + form + " 2>&-",
                                     migrationHost(), GetParam(), root()}});
  }
};

constexpr const char* kWarning = "1 account was not carried over: Accounts[0]";

TEST_P(ClosedErrors, LeaveTheWarningInTheText) {
  const ProgramResult result = run("");

  EXPECT_EQ(result.exitStatus, kNotAllCarriedOver);
  EXPECT_NE(result.output.find(std::string("Warning: ") + kWarning), std::string::npos)
      << result.output;
}

TEST_P(ClosedErrors, LeaveTheWarningInTheObject) {
  const ProgramResult result = run("--json");

  EXPECT_EQ(result.exitStatus, kNotAllCarriedOver);
  const nlohmann::json warnings = onlyObject(result)["warnings"];
  ASSERT_EQ(warnings.size(), 1U);
  EXPECT_TRUE(warnings[0].get<std::string>().starts_with(kWarning)) << warnings;
}

INSTANTIATE_TEST_SUITE_P(Of, ClosedErrors, testing::Values("run", "plan"),
                         [](const auto& information) { return information.param; });

constexpr const char* kSettings =
    "ROOT/var/mobile/Library/Preferences/com.quarx.accountsettings.plist";
constexpr const char* kMail = "ROOT/var/mobile/Library/Mail/Accounts.plist";

const Command kHostCommands[] = {
    {{"host", "run", "--root", "ROOT"}, kNotAllCarriedOver},
    {{"host", "run", "--root", "ROOT", "--json"}, kNotAllCarriedOver},
    {{"host", "run", "--root", "ROOT", "--channel", "-"}, kNotAllCarriedOver},
    {{"host", "run", "--root", "ROOT", "--bare", "--channel", "-"}},
    {{"host", "run", "--root", "ROOT", "--home", "/MARKS"}},
    {{"host", "run", "--root", "ROOT", "--home", "MARKS"}, kUnusableArguments},
    {{"host", "run", "--root", "ROOT", "--device", "ROOT/none"}, kMissingInput},
    {{"host", "run", "--root", "ROOT", "--plugin", "ROOT"}, kMissingInput},
    {{"host", "run", "--root", "ROOT", "--channel", "ROOT/none/log"}, kCannotCreate},
    {{"host", "run", "--root", "ROOT", "--report", "ROOT/none/report"}, kCannotCreate},
    {{"host", "run", "--root", "ROOT/none", "--json"}, kMissingInput},
    {{"host", "run", "--root", "ROOT", "--MARKS"}, kUnusableArguments},
    {{"host", "run", "--root", "ROOT", "--lock-timeout", "MARKS"}, kUnusableArguments},
    {{"host", "MARKS", "--json"}, kUnusableArguments},
    {{"host", "plan", "--root", "ROOT"}, kNotAllCarriedOver},
    {{"host", "plan", "--root", "ROOT", "--json"}, kNotAllCarriedOver},
    {{"host", "plan", "--root", "ROOT", "--account", "MARKS"}, kNotAllCarriedOver},
    {{"host", "restore", "--root", "ROOT", "--list"}},
    {{"host", "restore", "--root", "ROOT", "--list", "--json"}},
    {{"host", "restore", "--root", "ROOT"}, kMissingInput},
    {{"host", "restore", "--root", "ROOT", "--from", "MARKS", "--json"}, kMissingInput},
    {{"host", "restore", "--root", "ROOT", "--from", "Kept-MARKS", "--discard"}},
};

const Command kToolCommands[] = {
    {{"accountsctl", "show", kSettings, "--properties", "--full"}},
    {{"accountsctl", "show", kSettings, "--json"}},
    {{"accountsctl", "show", "ROOT/in-xml", "--xml"}},
    {{"accountsctl", "show", kSettings, "--xml"}, kMalformedInput},
    {{"accountsctl", "show", kMail}},
    {{"accountsctl", "show", "ROOT/other"}},
    {{"accountsctl", "show", "ROOT/none"}, kMissingInput},
    {{"accountsctl", "diff", kSettings, "ROOT/settings"}, kAttention},
    {{"accountsctl", "diff", kSettings, "ROOT/settings", "--json"}, kAttention},
    {{"accountsctl", "diff", "ROOT/other", "ROOT/in-xml"}, kAttention},
    {{"accountsctl", "diff", kSettings, kMail}, kMalformedInput},
    {{"accountsctl", "check", kSettings}, kAttention},
    {{"accountsctl", "check", kMail, "--json"}, kAttention},
    {{"accountsctl", "check", kSettings, "--device", "ROOT/none"}, kMissingInput},
    {{"accountsctl", "status", "--root", "ROOT"}},
    {{"accountsctl", "status", "--root", "ROOT", "--json"}},
    {{"accountsctl", "status", "--root", "ROOT/none"}, kMissingInput},
    {{"accountsctl", "convert", "ROOT/in-xml", "-", "--to", "xml"}},
    {{"accountsctl", "convert", "ROOT/other", "-", "--to", "xml"}, kMalformedInput},
    {{"accountsctl", "convert", "ROOT/none", "-", "--to", "xml"}, kMissingInput},
    {{"accountsctl", "convert", "ROOT/other", "ROOT/none/x", "--to", "binary"}, kCannotCreate},
    {{"accountsctl", "convert", "ROOT/other", "ROOT/x", "--to", "MARKS"}, kUnusableArguments},
    {{"accountsctl", "summarize", "ROOT/report"}, kAttention},
    {{"accountsctl", "summarize", "ROOT/report", "--json"}, kAttention},
    {{"accountsctl", "summarize", "ROOT/report", "--list", "losses", "--reasons"}},
    {{"accountsctl", "summarize", "ROOT/none"}, kMissingInput},
    {{"accountsctl", "explain", "ROOT/report", "MARKS"}},
    {{"accountsctl", "explain", "ROOT/report", "MARKS", "--json"}},
    {{"accountsctl", "explain", "ROOT/report", "MARKS-"}, kMissingInput},
    {{"accountsctl", "explain", "ROOT/none", "MARKS"}, kMissingInput},
    {{"accountsctl", "MARKS"}, kUnusableArguments},
};

INSTANTIATE_TEST_SUITE_P(OfTheHost, HostileMarks, testing::ValuesIn(kHostCommands));
INSTANTIATE_TEST_SUITE_P(OfTheTool, HostileMarks, testing::ValuesIn(kToolCommands));

}  // namespace
}  // namespace accounts
