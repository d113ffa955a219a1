#include "commandline/ArgumentParsing.h"

#include <gtest/gtest.h>

#include <CLI/CLI.hpp>
#include <string>
#include <vector>

namespace accounts {
namespace {

/// A program with the subcommands "show FILE [--json]" and "status".
class ArgumentParsingTest : public testing::Test {
 protected:
  ArgumentParsingTest() {
    program.set_version_flag("--version", "program 1");
    CLI::App& show = *program.add_subcommand("show", "Shows.");
    show.add_option("FILE", file, "A file")->required();
    show.add_flag("--json", json, "JSON");
    program.add_subcommand("status", "Tells.");
  }

  ArgumentParsing parse(std::vector<const char*> arguments) {
    arguments.insert(arguments.begin(), "program");
    return parseArguments(program, static_cast<int>(arguments.size()), arguments.data());
  }

  std::string problemOf(const std::vector<const char*>& arguments) {
    const ArgumentParsing parsing = parse(arguments);
    const auto* unusable = std::get_if<UnusableArguments>(&parsing);
    return unusable != nullptr ? unusable->message : "none";
  }

  CLI::App program{"A program.", "program"};
  std::string file;
  bool json = false;
};

TEST_F(ArgumentParsingTest, ArgumentsThatCanBeUsedAreParsed) {
  EXPECT_TRUE(std::holds_alternative<ParsedArguments>(parse({"show", "a", "--json"})));
  EXPECT_EQ(file, "a");
  EXPECT_TRUE(json);
}

TEST_F(ArgumentParsingTest, ADashIsAnArgumentLikeAnyOther) {
  EXPECT_TRUE(std::holds_alternative<ParsedArguments>(parse({"show", "-"})));
  EXPECT_EQ(file, "-");
}

TEST_F(ArgumentParsingTest, HelpIsThatOfTheSubcommand) {
  EXPECT_NE(std::get<RequestedText>(parse({"show", "--help"})).text.find("FILE"),
            std::string::npos);
}

TEST_F(ArgumentParsingTest, TheVersionIsOneLine) {
  EXPECT_EQ(std::get<RequestedText>(parse({"--version"})).text, "program 1\n");
}

TEST_F(ArgumentParsingTest, AMisspeltSubcommandIsNamedWithASuggestion) {
  EXPECT_EQ(problemOf({"shwo", "a"}),
            "Unknown subcommand: shwo; did you mean 'show'? (--help explains)");
}

TEST_F(ArgumentParsingTest, AMisspeltSubcommandIsNamedRatherThanItsOptions) {
  EXPECT_EQ(problemOf({"shwo", "--json", "FILE"}),
            "Unknown subcommand: shwo; did you mean 'show'? (--help explains)");
}

TEST_F(ArgumentParsingTest, ASubcommandLikeNoneIsNamedWithoutASuggestion) {
  EXPECT_EQ(problemOf({"migrate"}), "Unknown subcommand: migrate (--help explains)");
}

TEST_F(ArgumentParsingTest, AMisspeltOptionIsNamedAlthoughAnArgumentIsMissingToo) {
  EXPECT_EQ(problemOf({"show", "--jsno"}),
            "Unknown option: --jsno; did you mean '--json'? (--help explains)");
}

TEST_F(ArgumentParsingTest, AMisspeltOptionIsNamedWithoutItsValue) {
  EXPECT_EQ(problemOf({"show", "a", "--jso=x"}),
            "Unknown option: --jso; did you mean '--json'? (--help explains)");
}

TEST_F(ArgumentParsingTest, ASurplusArgumentIsNamed) {
  EXPECT_EQ(problemOf({"show", "a", "b"}), "Unexpected argument: b (--help explains)");
}

TEST_F(ArgumentParsingTest, AMissingArgumentIsNamed) {
  EXPECT_EQ(problemOf({"show"}), "FILE is needed (--help explains)");
}

TEST_F(ArgumentParsingTest, WithoutASubcommandAllOfThemAreNamed) {
  EXPECT_EQ(problemOf({}), "A subcommand is required: show, status (--help explains)");
}

TEST_F(ArgumentParsingTest, TwoSubcommandsAreRefused) {
  EXPECT_EQ(problemOf({"status", "status"}), "Unexpected argument: status (--help explains)");
  EXPECT_EQ(problemOf({"status", "show"}), "Unexpected argument: show (--help explains)");
}

}  // namespace
}  // namespace accounts
