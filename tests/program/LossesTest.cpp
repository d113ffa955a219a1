// What a migration does not carry over, with the real programs: the status, the words, the kept
// files, and that they can be put back. tests/ledger/LossesTest.cpp has the rules one by one.

#include <gmock/gmock.h>

#include <functional>
#include <optional>

#include "tests/fakes/StoreContents.h"
#include "tests/program/ExitStatuses.h"
#include "tests/program/Programs.h"
#include "tests/program/SafetyNetFixture.h"

namespace accounts {
namespace {

using testing::ElementsAreArray;
using testing::HasSubstr;

AccountDictionary calendars(std::string_view identifier) {
  return anAccount(identifier, "CalDAV", "CalDAVAccount");
}
AccountDictionary description(std::string_view identifier,
                              std::string_view accountClass = "IMAPAccount") {
  return aMailDescription(identifier, accountClass).with("Password", identifier);
}

struct Loss {
  const char* name;
  std::optional<PropertyDictionary> settings;
  std::optional<PropertyDictionary> mail;
  std::optional<PropertyDictionary> exchange;
  /// What each line says of the account and where it stood, and why.
  std::vector<std::string> lines;
};

void PrintTo(const Loss& loss, std::ostream* output) {
  *output << loss.name;
}

std::vector<Loss> losses() {
  const std::string ofSettings = std::string(" of ") + kSettingsPath + ": ";
  const std::string ofMail = std::string(" of ") + kLegacyMailPath + ": ";
  const std::string ofExchange = std::string(" of ") + kLegacyExchangePath + ": ";
  const std::string shared = "; another account has its identifier";
  const std::string replaced = "all accounts of its type gave way to others (";
  const PropertyDictionary exchange = {{"DAAccountConfigurationAccountID", "A"},
                                       {"DAAccountConfigurationClass", "ASAccount"}};
  return {
      {"TwoDescriptionsOfOneIdentifier",
       {},
       mailStore({description("A"), description("A").with("Password", "x")}),
       {},
       {"MailAccounts[1] (identifier A)" + ofMail + "its \"Password\" gave way to another value" +
        shared}},
      {"OneIdentifierInBothStores",
       {},
       mailStore({description("A")}),
       exchangeStore({exchange}),
       {"DAAccountsKey[0] (identifier A)" + ofExchange +
        "another account with its identifier took its place: it has a \"Password\" that it did not "
        "have"}},
      {"AnIdentifierOfTheSettingsFile",
       accountSettings(12, {calendars("A")}),
       mailStore({description("A")}),
       {},
       {"MailAccounts[0] (identifier A)" + ofMail + "its \"Class\" gave way to another value" +
        shared}},
      {"AnIdentifierOfAChild",
       accountSettings(
           12, {anAccount("Q", "QuarxAccount", "ZQAccount").withChildren({calendars("A")})}),
       mailStore({description("A")}),
       {},
       {"MailAccounts[0] (identifier A)" + ofMail}},
      {"AStoreOfAnotherForm",
       {},
       PropertyDictionary{{"MailAccounts", "text"}},
       {},
       {std::string(kLegacyMailPath) +
        " holds accounts in an unknown form: its \"MailAccounts\" is no array"}},
      {"ARefusedDescription",
       {},
       mailStore({description("A"), description("B").without("AccountType")},
                 {description("C", "SMTPAccount")}),
       {},
       {"DeliveryAccounts[0] (identifier C)" + ofMail + "another account of its store was refused",
        "MailAccounts[0] (identifier A)" + ofMail + "another account of its store was refused",
        "MailAccounts[1] (identifier B)" + ofMail + "it has no class"}},
      {"AKeyThatAnotherKeyReplaces",
       {},
       mailStore({description("A").with("Class", "Odd")}),
       {},
       {"MailAccounts[0] (identifier A)" + ofMail +
        "its \"Class\" gave way to the value under \"AccountType\""}},
      {"AnEmptyMailStore",
       accountSettings(
           12, {anAccount("A", "Mail", "IMAPAccount"), anAccount("B", "SMTP", "SMTPAccount")}),
       mailStore({}),
       {},
       {"Accounts[0] (identifier A)" + ofSettings + replaced + "_migrateMailAccounts:)",
        "Accounts[1] (identifier B)" + ofSettings + replaced + "_migrateMailAccounts:)"}},
      {"AnEmptyExchangeStore",
       accountSettings(12, {anAccount("A", "Exchange", "ASAccount")}),
       {},
       exchangeStore({}),
       {"Accounts[0] (identifier A)" + ofSettings + replaced + "_migrateDAAccounts:)"}},
      {"AccountsThatAreRefused",
       accountSettings(12, {anAccount("A", "Unknown", "X"), calendars("B").without("Type"),
                            calendars("C").with("Type", 5), calendars("D").without("Class"),
                            calendars("E").with("Class", ""), calendars("F").with("Class", 5),
                            anAccount("G", "Mail", "Odd"), "no dictionary"}),
       {},
       {},
       {"Accounts[0] (identifier A)" + ofSettings + "its type is unknown",
        "Accounts[1] (identifier B)" + ofSettings + "it has no type",
        "Accounts[2] (identifier C)" + ofSettings + "it has no type",
        "Accounts[3] (identifier D)" + ofSettings + "it has no class",
        "Accounts[4] (identifier E)" + ofSettings + "it has no class",
        "Accounts[5] (identifier F)" + ofSettings + "it has no class",
        "Accounts[6] (identifier G)" + ofSettings + "nothing tells the class of the mail account",
        "Accounts[7]" + ofSettings + "it is no dictionary"}},
      {"AccountsAsADictionary",
       PropertyDictionary{{"Version", 12}, {"Accounts", PropertyDictionary{{"A", calendars("A")}}}},
       {},
       {},
       {std::string(kSettingsPath) +
        " holds accounts in an unknown form: its \"Accounts\" is no array"}},
      {"ChildrenOfADroppedAccount",
       accountSettings(12, {anAccount("A", "Unknown", "X").withChildren({calendars("K")})}),
       {},
       {},
       {"Accounts[0] (identifier A)" + ofSettings + "its type is unknown",
        "Accounts[0].ChildAccounts[0] (identifier K)" + ofSettings +
            "its parent was not carried over"}},
      {"TheFirstOfThreeOfOneIdentifier",
       accountSettings(12,
                       {calendars("A").with("Hostname", "1"), calendars("A").with("Hostname", "2"),
                        calendars("A").with("Hostname", "3")}),
       {},
       {},
       {"Accounts[0] (identifier A)" + ofSettings + "its \"Hostname\" gave way to another value" +
            shared,
        "Accounts[1] (identifier A)" + ofSettings + "its \"Hostname\" gave way to another value" +
            shared}},
  };
}

class Losses : public SafetyNetFixture, public testing::WithParamInterface<Loss> {
 protected:
  void SetUp() override {
    for (const auto& [path, contents] : files()) {
      if (contents) {
        write(path, *contents);
      }
    }
  }
  static std::vector<std::pair<const char*, std::optional<PropertyDictionary>>> files() {
    return {{kSettingsPath, GetParam().settings},
            {kLegacyMailPath, GetParam().mail},
            {kLegacyExchangePath, GetParam().exchange}};
  }
};

TEST_P(Losses, AreForetoldNamedKeptAndCanBePutBack) {
  ProgramCall call = migrationCall({"--json"});
  call.arguments.front() = "plan";
  const nlohmann::json plan = onlyObject(runProgram(call));
  const nlohmann::json status = onlyObject(
      runProgram({.program = accountsctl(), .arguments = {"status", "--root", root(), "--json"}}));

  const ProgramResult result = migrate({"--json"});

  EXPECT_EQ(result.exitStatus, kNotAllCarriedOver);
  const nlohmann::json object = onlyObject(result);
  const auto lines = object["ledger"]["losses"].get<std::vector<std::string>>();
  std::vector<testing::Matcher<std::string>> expected;
  for (const std::string& line : GetParam().lines) {
    expected.push_back(testing::StartsWith(line));
  }
  EXPECT_THAT(lines, ElementsAreArray(expected));
  EXPECT_EQ(plan["ledger"]["counts"], object["ledger"]["counts"]);
  EXPECT_EQ(plan["ledger"]["losses"], object["ledger"]["losses"]);
  EXPECT_EQ(status["ledger"], object["ledger"]);
  EXPECT_EQ(plan["exitStatus"], kNotAllCarriedOver);
  EXPECT_THAT(object["outcome"].get<std::string>(), HasSubstr(lines.front()));
  const std::string folder = onlyKeptFolder();
  EXPECT_THAT(result.errors, HasSubstr(lines.front()));
  EXPECT_THAT(result.errors, HasSubstr(folder));

  EXPECT_EQ(restore().exitStatus, 0);

  for (const auto& [path, contents] : files()) {
    EXPECT_EQ(exists(path), contents.has_value()) << path;
    if (contents && exists(path)) {
      EXPECT_EQ(readDictionary(path), *contents) << path;
    }
  }
}

TEST_P(Losses, AreEachALineOfTheSummaryAndOfTheStatusBefore) {
  const ProgramResult status =
      runProgram({.program = accountsctl(), .arguments = {"status", "--root", root()}});

  const ProgramResult result = migrate();

  EXPECT_THAT(result.output, HasSubstr("not carried over:\n"));
  for (const std::string& line : GetParam().lines) {
    EXPECT_THAT(result.output, HasSubstr("  Not carried over: " + line));
    EXPECT_THAT(status.output, HasSubstr("\nNot carried over: " + line));
  }
}

INSTANTIATE_TEST_SUITE_P(Device, Losses, testing::ValuesIn(losses()),
                         [](const auto& information) { return information.param.name; });

}  // namespace
}  // namespace accounts
