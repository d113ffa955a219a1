#include <algorithm>
#include <fstream>
#include <regex>
#include <sstream>

#include "tests/packaging/InstalledPackages.h"
#include "tests/program/Programs.h"

namespace accounts {
namespace {

using Names = std::set<std::string>;

/// A subcommand of a program, or the program itself when it has no name.
struct Subcommand {
  std::string program;
  std::string name;
};

void PrintTo(const Subcommand& subcommand, std::ostream* stream) {
  *stream << subcommand.program << " " << subcommand.name;
}

/// What the manual pages and the completions say of each option that --help has.
class DocumentedOptions : public testing::TestWithParam<Subcommand> {
 protected:
  [[nodiscard]] static std::string path() {
    return GetParam().program == "accountsctl" ? accountsctl() : migrationHost();
  }

  /// The long options of the subcommand.
  [[nodiscard]] static Names options() {
    const ProgramResult help =
        runProgram({.program = path(), .arguments = {GetParam().name, "--help"}});
    EXPECT_EQ(help.exitStatus, 0) << help.errors;
    Names names;
    const std::regex option("^ +(-h,)?(--[a-z-]+)");
    for (const std::string& line : help.outputLines()) {
      if (std::smatch match; std::regex_search(line, match, option)) {
        names.insert(match[2]);
      }
    }
    return names;
  }

  [[nodiscard]] static std::string sourceOf(const std::string& file) {
    std::ostringstream text;
    text << std::ifstream(SOURCE_DIRECTORY "/" + file).rdbuf();
    return text.str();
  }

  /// What bash completes after the subcommand and the beginning of a word.
  [[nodiscard]] static Names completions(const std::string& word) {
    const std::string& program = GetParam().program;
    std::string function = "_" + program;
    std::replace(function.begin(), function.end(), '-', '_');
    const std::string script = "source '" SOURCE_DIRECTORY "/completion/" + program +
                               "'; COMP_WORDS=(\"$@\"); COMP_CWORD=2; " + function +
                               "; printf '%s\\n' \"${COMPREPLY[@]}\"";
    const ProgramResult result = runProgram(
        {.program = "bash", .arguments = {"-c", script, "bash", program, GetParam().name, word}});
    EXPECT_EQ(result.errors, "");
    const std::vector<std::string> lines = result.outputLines();
    return {lines.begin(), lines.end()};
  }
};

TEST_P(DocumentedOptions, AreInTheManualPage) {
  std::string page = sourceOf("docs/man/" + GetParam().program + ".1");
  page.erase(std::remove(page.begin(), page.end(), '\\'), page.end());
  const Names wanted = options();
  EXPECT_TRUE(wanted.contains("--json"));
  for (const std::string& option : wanted) {
    EXPECT_TRUE(std::regex_search(page, std::regex(option + "[~\n]"))) << option;
  }
  EXPECT_NE(page.find(".B " + GetParam().name), std::string::npos);
}

TEST_P(DocumentedOptions, AreCompletedAndNoOthers) {
  EXPECT_EQ(completions("--"), options());
}

INSTANTIATE_TEST_SUITE_P(
    Programs, DocumentedOptions,
    testing::Values(Subcommand{"migration-host", "run"}, Subcommand{"migration-host", "plan"},
                    Subcommand{"migration-host", "restore"}, Subcommand{"accountsctl", "show"},
                    Subcommand{"accountsctl", "diff"}, Subcommand{"accountsctl", "check"},
                    Subcommand{"accountsctl", "status"}, Subcommand{"accountsctl", "convert"},
                    Subcommand{"accountsctl", "explain"}, Subcommand{"accountsctl", "summarize"}));

TEST(ManualPages, HaveTheSectionsThatPeopleLookFor) {
  for (const char* page : {"migration-host.1", "accountsctl.1"}) {
    std::ostringstream text;
    text << std::ifstream(SOURCE_DIRECTORY "/docs/man/" + std::string(page)).rdbuf();
    for (const char* section : {"NAME", "SYNOPSIS", "DESCRIPTION", "EXIT STATUS", "FILES",
                                "ENVIRONMENT", "EXAMPLES", "SEE ALSO"}) {
      const std::string heading = "\n.SH " + std::string(section) + "\n";
      const std::size_t place = text.str().find(heading);
      ASSERT_NE(place, std::string::npos) << page << " " << section;
      EXPECT_NE(text.str().substr(place + heading.size(), 4), ".SH ") << page << " " << section;
    }
  }
}

TEST(ManualPages, HaveNothingThatACheckerWarnsOf) {
  for (const char* page : {"migration-host.1", "accountsctl.1"}) {
    const ProgramResult result =
        runProgram({.program = "mandoc",
                    .arguments = {"-T", "lint", "-W", "warning",
                                  SOURCE_DIRECTORY "/docs/man/" + std::string(page)}});
    EXPECT_EQ(result.exitStatus, 0) << result.output << result.errors;
  }
}

}  // namespace
}  // namespace accounts
