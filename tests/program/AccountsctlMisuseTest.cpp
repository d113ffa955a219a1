#include <sys/stat.h>
#include <unistd.h>

#include <filesystem>

#include "tests/program/AccountsctlFixture.h"
#include "tests/program/Programs.h"

namespace accounts {
namespace {

/// Ways to use the program wrongly, whatever the subcommand does.
class AccountsctlMisuse : public AccountsctlFixture {
 protected:
  static std::string textFor(const std::vector<std::string>& arguments) {
    const ProgramResult result = run(arguments);
    EXPECT_EQ(result.exitStatus, 0);
    EXPECT_EQ(result.errors, "");
    return result.output;
  }
};

TEST_F(AccountsctlMisuse, NoArgumentsAreRefused) {
  expectRefused(run({}), kUnusableArguments, "A subcommand is required: show, diff");
}

TEST_F(AccountsctlMisuse, AMisspeltSubcommandIsRefusedWithASuggestion) {
  expectRefused(run({"shwo", "x"}), kUnusableArguments, "shwo; did you mean 'show'?");
}

TEST_F(AccountsctlMisuse, AMisspeltOptionIsRefusedWithASuggestion) {
  expectRefused(run({"show", "--show-secret", "x"}), kUnusableArguments,
                "did you mean '--show-secrets'?");
}

TEST_F(AccountsctlMisuse, MissingAndSurplusFilesAreRefused) {
  expectRefused(run({"show"}), kUnusableArguments, "FILE");
  expectRefused(run({"show", "a", "b"}), kUnusableArguments, "b");
  expectRefused(run({"show", ""}), kUnusableArguments, "FILE");
  expectRefused(run({"convert", "a", "--to", "xml"}), kUnusableArguments, "OUT");
}

TEST_F(AccountsctlMisuse, AnUnknownFormIsRefused) {
  expectRefused(run({"convert", "a", "b"}), kUnusableArguments, "--to");
  expectRefused(run({"convert", "a", "b", "--to", "json"}), kUnusableArguments,
                "must be xml or binary");
}

TEST_F(AccountsctlMisuse, TwoFormsAtOnceAreRefused) {
  const ProgramResult result = run({"show", "a", "--json", "--xml"});

  EXPECT_EQ(result.exitStatus, kUnusableArguments);
}

TEST_F(AccountsctlMisuse, EveryRefusalIsInTheProgramsOwnWords) {
  const std::pair<std::vector<std::string>, std::string> cases[] = {
      {{"show"}, "FILE is needed"},
      {{"show", "a", "--json", "--xml"}, "--json and --xml cannot be given together"},
      {{"show", "show", "show"}, "Unexpected argument: show"},
      {{"--properties", "show", "a"}, "--properties has to stand behind show"},
      {{"status"}, "--root DIR is needed"},
      {{"status", "--root"}, "The DIR of --root is missing"},
      {{"status", "--root", "a", "--root", "b"}, "--root is given more than once"},
      {{"check", "a", "--plugin"}, "The BUNDLE of --plugin is missing"},
      {{"convert", "a", "b"}, "--to FORM is needed"},
      {{"convert", "a", "b", "--to", "json"}, "--to: must be xml or binary"},
      {{"summarize", "a", "--null"}, "--null needs --list WHICH"},
      {{"summarize", "a", "--expected", "-1"},
       "--expected: must be a whole number, at most 999999999"},
      {{"summarize", "a", "--expected", "1e999"},
       "--expected: must be a whole number, at most 999999999"},
      {{"summarize", "a", "--expected", "10000000000000000000000"},
       "--expected: must be a whole number, at most 999999999"}};
  for (const auto& [arguments, message] : cases) {
    const ProgramResult result = run(arguments);
    EXPECT_EQ(result.exitStatus, kUnusableArguments) << message;
    EXPECT_EQ(result.errors, "accountsctl: " + message + " (--help explains)\n");
  }
}

TEST_F(AccountsctlMisuse, ARefusalAsAnObjectHasTheRootThatWasNamed) {
  for (const std::vector<std::string>& arguments :
       {std::vector<std::string>{"status", "--json", "--root", "/image", "--what"},
        {"status", "--root=/image", "--json", "--home", "relative"}}) {
    const nlohmann::json object = onlyObject(run(arguments));
    EXPECT_EQ(object["root"], "/image");
    EXPECT_EQ(object["exitStatus"], kUnusableArguments);
  }
  EXPECT_FALSE(onlyObject(run({"status", "--json"})).contains("root"));
}

TEST_F(AccountsctlMisuse, AnArgumentWithALineBreakStillGivesOneLine) {
  expectRefused(run({"a\nb"}), kUnusableArguments, "a\\nb");
}

TEST_F(AccountsctlMisuse, WithJSONARefusalIsOneObjectAsWell) {
  const ProgramResult result = run({"show", "--json"});

  EXPECT_EQ(result.exitStatus, kUnusableArguments);
  EXPECT_EQ(result.errorLines().size(), 1U) << result.errors;
  const nlohmann::json object = onlyObject(result);
  EXPECT_EQ(object["command"], "show");
  EXPECT_EQ(object["exitStatus"], kUnusableArguments);
  EXPECT_NE(object["error"].get<std::string>().find("FILE"), std::string::npos);
  EXPECT_EQ(onlyObject(run({"--json"}))["command"], nullptr);
}

TEST_F(AccountsctlMisuse, AMissingFileIsMissingInput) {
  expectRefused(run({"show", path("none")}), kMissingInput, "No such file or directory");
}

TEST_F(AccountsctlMisuse, ADirectoryIsMissingInput) {
  expectRefused(run({"show", path("")}), kMissingInput, "directory");
}

TEST_F(AccountsctlMisuse, AFileThatMayNotBeReadIsMissingInput) {
  const std::string file = writeText("file", "x");
  ASSERT_EQ(chmod(file.c_str(), 0), 0);
  std::filesystem::permissions(path(""), std::filesystem::perms(0755));
  ProgramCall call{.program = accountsctl(), .arguments = {"show", file}};
  if (getuid() == 0) {
    // Root may read every file.
    constexpr uid_t kSomeUser = 54321;
    call.user = kSomeUser;
  }

  expectRefused(runProgram(call), kMissingInput, "Permission denied");
}

TEST_F(AccountsctlMisuse, AFileThatIsNoPropertyListIsMalformed) {
  expectRefused(run({"show", writeText("text", "hello")}), kMalformedInput, "in line 1");
  expectRefused(run({"show", writeText("empty", "")}), kMalformedInput, "the file is empty");
}

TEST_F(AccountsctlMisuse, EmptyStandardInputIsMalformed) {
  expectRefused(run({"show", "-"}), kMalformedInput, "standard input");
}

TEST_F(AccountsctlMisuse, ClosedStandardInputIsMissingInput) {
  expectRefused(runRedirected({"show", "-"}, "<&-"), kMissingInput, "standard input");
}

TEST_F(AccountsctlMisuse, AResultThatCannotBeWrittenIsAnError) {
  const std::string file = write("file", PropertyDictionary{{"Version", 12}});

  for (const char* redirection : {">/dev/full", ">&-"}) {
    const ProgramResult result = runRedirected({"show", file}, redirection);
    EXPECT_EQ(result.exitStatus, kInputOutputError) << redirection;
    EXPECT_TRUE(result.hasErrorLine("accountsctl: The result cannot be written to standard output"))
        << result.errors;
  }
}

TEST_F(AccountsctlMisuse, HelpOfEachSubcommandHasItsExitStatusesAndExamples) {
  for (const char* subcommand : {"show", "diff", "check", "status", "convert"}) {
    const std::string help = textFor({subcommand, "--help"});
    EXPECT_NE(help.find("Exit status:\n  0 "), std::string::npos) << help;
    EXPECT_NE(help.find("Examples:\n  accountsctl " + std::string(subcommand)), std::string::npos)
        << help;
    EXPECT_NE(textFor({"--help"}).find(subcommand), std::string::npos);
  }
}

TEST_F(AccountsctlMisuse, TheProgramAndItsSubcommandsTellTheSameVersion) {
  const std::string version = textFor({"--version"});

  EXPECT_TRUE(version.starts_with("accountsctl ")) << version;
  EXPECT_EQ(textFor({"show", "--version"}), version);
}

}  // namespace
}  // namespace accounts
