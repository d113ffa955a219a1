#include <gtest/gtest.h>

#include <fstream>
#include <regex>
#include <set>
#include <sstream>

#include "tests/program/Programs.h"
#include "tests/program/RunProgram.h"

namespace accounts {
namespace {

/// The names that the plug-in's export map lists as global.
std::set<std::string> listedSymbols() {
  std::ifstream stream(SOURCE_DIRECTORY "/migrator/exports.map");
  const std::regex name(R"(\s+(\w+);)");
  std::set<std::string> symbols;
  for (std::string line; std::getline(stream, line);) {
    std::smatch match;
    if (std::regex_match(line, match, name)) {
      symbols.insert(match[1]);
    }
  }
  return symbols;
}

/// The names that other programs can find in the plug-in.
std::set<std::string> exportedSymbols() {
  const ProgramResult result = runProgram(
      {.program = "nm",
       .arguments = {"-D", "--defined-only", "-j", pluginBundle() + "/AccountsDataMigrator.so"}});
  EXPECT_EQ(result.exitStatus, 0) << result.errors;
  const std::vector<std::string> lines = result.outputLines();
  return {lines.begin(), lines.end()};
}

TEST(ExportedSymbols, AreExactlyTheEntryPointAndTheVocabulary) {
  const std::set<std::string> listed = listedSymbols();

  ASSERT_TRUE(listed.contains("CreateMigrationPlugin"));
  ASSERT_TRUE(listed.contains("kAccountIdentifier"));
  EXPECT_EQ(exportedSymbols(), listed);
}

}  // namespace
}  // namespace accounts
