#include <gmock/gmock.h>

#include "tests/program/DeviceRootFixture.h"
#include "tests/program/ExitStatuses.h"
#include "tests/program/Programs.h"

namespace accounts {
namespace {

using testing::HasSubstr;

/// The story of one account, as a plan and as a report tell it.
class AccountStory : public DeviceRootFixture {
 protected:
  void SetUp() override {
    write(kSettingsPath,
          PropertyDictionary{
              {"Version", 1},
              {"Accounts",
               PropertyArray{PropertyDictionary{{"Identifier", "OLD"},
                                                {"uniqueId", "NEW"},
                                                {"Type", "Mail"},
                                                {"Class", "IMAPAccount"}},
                             PropertyDictionary{{"Identifier", "LOST"}, {"Type", "Unknown"}}}}});
  }
  [[nodiscard]] ProgramResult plan(const std::vector<std::string>& arguments) const {
    std::vector<std::string> all = {"plan", "--root", root()};
    all.insert(all.end(), arguments.begin(), arguments.end());
    return runProgram({.program = migrationHost(), .arguments = all});
  }
};

TEST_F(AccountStory, TellsWhereAnAccountCameFromWhatWasDoneToItAndWhereItIs) {
  const std::string story = plan({"--account", "NEW"}).output;

  EXPECT_THAT(story, HasSubstr("Accounts[0] of " + std::string(kSettingsPath) +
                               ": renamed, now Accounts[0]\n"));
  EXPECT_THAT(story, HasSubstr("(_migrateAccountsFrom7A242:): changed\n"
                               "    Enabled Dataclasses: none → "));
  EXPECT_THAT(story, HasSubstr("Afterwards: Mail, account 1, identifier NEW\n"));
}

TEST_F(AccountStory, IsTheSameByTheNameThatTheAccountHadBefore) {
  EXPECT_EQ(plan({"--account", "OLD"}).output, plan({"--account", "NEW"}).output);
}

TEST_F(AccountStory, SaysWhyAnAccountIsNotThere) {
  EXPECT_EQ(plan({"--account", "LOST"}).output,
            "Accounts[1] of " + std::string(kSettingsPath) +
                ": not carried over, since its type is unknown\n"
                "Open the settings file (initInsideOfMigration): removed\n"
                "Afterwards: not in the settings file\n");
}

TEST_F(AccountStory, IsNotThatOfAnotherAccountThatGotTheIdentifier) {
  write(kSettingsPath,
        PropertyDictionary{
            {"Version", 1},
            {"Accounts", PropertyArray{PropertyDictionary{{"Identifier", "A"},
                                                          {"uniqueId", "B"},
                                                          {"Type", "Mail"},
                                                          {"Class", "IMAPAccount"}},
                                       PropertyDictionary{{"Identifier", "C"},
                                                          {"uniqueId", "A"},
                                                          {"Type", "Exchange"},
                                                          {"Class", "ExchangeAccount"}}}}});

  const std::string story = plan({"--account", "B"}).output;

  EXPECT_THAT(story, HasSubstr("Accounts[0] of"));
  EXPECT_THAT(story, HasSubstr("Identifier: A → B\n"));
  EXPECT_EQ(story.find("Accounts[1] of"), std::string::npos) << story;
  EXPECT_EQ(story.find("C → A"), std::string::npos) << story;
}

TEST_F(AccountStory, CutsALongValueBeforeACharacterAndNotInIt) {
  const std::string whole(59, 'a');
  write(kSettingsPath,
        PropertyDictionary{
            {"Version", 1},
            {"Accounts", PropertyArray{PropertyDictionary{{"Identifier", "OLD"},
                                                          {"uniqueId", whole + "éé"},
                                                          {"Type", "Mail"},
                                                          {"Class", "IMAPAccount"}}}}});

  EXPECT_THAT(plan({"--account", "OLD"}).output, HasSubstr("Identifier: OLD → " + whole + "…\n"));
}

TEST_F(AccountStory, OfNobodySaysSo) {
  EXPECT_EQ(plan({"--account", "NOBODY"}).output,
            "No account has, or had, the identifier NOBODY\n");
}

TEST_F(AccountStory, IsToldFromAReportAsFromAPlan) {
  const std::string report = onThisMachine("/report.json").string();
  const std::string told = plan({"--account", "NEW", "--report", report}).output;

  const ProgramResult explained =
      runProgram({.program = accountsctl(), .arguments = {"explain", report, "NEW"}});

  EXPECT_EQ(explained.exitStatus, 0);
  EXPECT_EQ(explained.output, told);
}

TEST_F(AccountStory, NeedsAReportThatHasTheAccount) {
  const std::string report = onThisMachine("/report.json").string();
  ASSERT_EQ(plan({"--report", report}).exitStatus, kNotAllCarriedOver);

  const ProgramResult unknown =
      runProgram({.program = accountsctl(), .arguments = {"explain", report, "NOBODY"}});
  EXPECT_EQ(unknown.exitStatus, kMissingInput);
  EXPECT_THAT(unknown.errors, HasSubstr("has no account with the identifier NOBODY"));
  const ProgramResult noReport = runProgram(
      {.program = accountsctl(), .arguments = {"explain", onThisMachine(kSettingsPath), "NEW"}});
  EXPECT_EQ(noReport.exitStatus, kMalformedInput);
  EXPECT_THAT(noReport.errors, HasSubstr("It is none that plan or run --report wrote"));
}

}  // namespace
}  // namespace accounts
