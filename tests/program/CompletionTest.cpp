#include <fstream>
#include <set>

#include "tests/program/DeviceRootFixture.h"

namespace accounts {
namespace {

namespace fs = std::filesystem;

using Names = std::multiset<std::string>;

/// What bash completes in a working directory with files of every kind.
class Completion : public DeviceRootFixture {
 protected:
  Completion() {
    for (const char* name :
         {"a.plist", "a.xml", "a.json", "a.jsonl", "a.html", "a.txt", "a b.plist", "other"}) {
      writeText("/here/" + std::string(name), "");
    }
    fs::create_directories(onThisMachine("/here/dir"));
  }

  /// The words after the program's name as bash divides them; the last one is completed.
  [[nodiscard]] Names completed(const std::string& program,
                                const std::vector<std::string>& words) const {
    std::string function = "_" + program;
    std::replace(function.begin(), function.end(), '-', '_');
    const std::string script =
        "source '" SOURCE_DIRECTORY "/completion/" + program +
        "'; COMP_WORDS=(\"$@\"); COMP_CWORD=$(($# - 1)); " + function +
        "; [[ ${#COMPREPLY[@]} == 0 ]] || printf '%s\\n' \"${COMPREPLY[@]}\"";
    std::vector<std::string> arguments = {"-c", script, "bash", program};
    arguments.insert(arguments.end(), words.begin(), words.end());
    const ProgramResult result = runProgram(
        {.program = "bash", .arguments = arguments, .directory = onThisMachine("/here").string()});
    EXPECT_EQ(result.errors, "");
    const std::vector<std::string> lines = result.outputLines();
    return {lines.begin(), lines.end()};
  }
};

TEST_F(Completion, OfARootIsDirectoriesHoweverTheOptionIsWritten) {
  const std::vector<std::vector<std::string>> lines = {
      {"--root", ""}, {"--root", "d"}, {"--root", "="}, {"--root", "=", "d"}};
  for (const std::vector<std::string>& words : lines) {
    for (const auto& [program, subcommand] : {std::pair("migration-host", "run"),
                                              {"migration-host", "plan"},
                                              {"migration-host", "restore"},
                                              {"accountsctl", "status"}}) {
      std::vector<std::string> all = {subcommand};
      all.insert(all.end(), words.begin(), words.end());
      EXPECT_EQ(completed(program, all), Names{"dir"}) << program << testing::PrintToString(all);
    }
  }
}

TEST_F(Completion, OfFilesIsThoseOfTheKind) {
  const Names propertyLists = {"a b.plist", "a.plist", "dir"};
  EXPECT_EQ(completed("migration-host", {"run", "--report", ""}), (Names{"a.json", "dir"}));
  EXPECT_EQ(completed("migration-host", {"plan", "--html", "=", ""}), (Names{"a.html", "dir"}));
  EXPECT_EQ(completed("migration-host", {"plan", "--device", ""}), propertyLists);
  EXPECT_EQ(completed("accountsctl", {"check", "--device", "="}), propertyLists);
  EXPECT_EQ(completed("accountsctl", {"show", ""}),
            (Names{"a b.plist", "a.plist", "a.xml", "dir"}));
  EXPECT_EQ(completed("accountsctl", {"diff", "a.plist", "a"}),
            (Names{"a b.plist", "a.plist", "a.xml"}));
  EXPECT_EQ(completed("accountsctl", {"summarize", ""}), (Names{"a.json", "a.jsonl", "dir"}));
  EXPECT_EQ(completed("accountsctl", {"summarize", "--roots", ""}), (Names{"a.txt", "dir"}));
  EXPECT_EQ(completed("accountsctl", {"status", ""}), Names{});
}

TEST_F(Completion, OfAKeptFolderIsThoseOfTheRoot) {
  const std::string kept = "/var/mobile/Library/AccountMigration/";
  for (const char* folder :
       {"Kept-20260102T030405Z", "Kept-20260103T030405Z", "Replaced-20260104T030405Z", "Other"}) {
    fs::create_directories(onThisMachine(kept + folder));
  }
  const Names all = {"Kept-20260102T030405Z", "Kept-20260103T030405Z", "Replaced-20260104T030405Z"};

  EXPECT_EQ(completed("migration-host", {"restore", "--root", root(), "--from", ""}), all);
  EXPECT_EQ(completed("migration-host", {"restore", "--root", "=", root(), "--from", "=", ""}),
            all);
  EXPECT_EQ(completed("migration-host", {"restore", "--root", root(), "--from", "Kept-20260103"}),
            Names{"Kept-20260103T030405Z"});
  EXPECT_EQ(completed("migration-host", {"restore", "--from", ""}), Names{});
  EXPECT_EQ(completed("migration-host",
                      {"restore", "--root", root(), "--home", "/var/none", "--from", ""}),
            Names{});
}

}  // namespace
}  // namespace accounts
