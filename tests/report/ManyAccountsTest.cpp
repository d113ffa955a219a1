#include <gmock/gmock.h>
#include <gtest/gtest.h>

#include "tests/report/Browser.h"
#include "tests/report/SampleReports.h"

namespace accounts {
namespace {

using nlohmann::json;

constexpr int kAccounts = 10000;

/// Ten thousand accounts on both sides, all changed by one step.
json reportOfMany() {
  json report = {{"command", "run"}, {"result", true}, {"exitStatus", 0}};
  json& stage =
      report["stages"].emplace_back(json{{"title", "Change everything"}, {"succeeded", true}});
  for (int number = 0; number < kAccounts; ++number) {
    const std::string name = std::to_string(number);
    const std::string title = "IMAP 'Account " + name + "'";
    const std::string element = "Accounts[" + name + "]";
    json before = plainAccount("ID-" + name, title,
                               {{"DisplayName", "Account " + name},
                                {"Hostname", "imap.example"},
                                {"PortNumber", 143},
                                {"Username", "user" + name}});
    before["element"] = element;
    json after = before;
    after["properties"]["PortNumber"] = 993;
    report["accountsBefore"].push_back(before);
    report["accountsAfter"].push_back(after);
    report["ledger"]["accounts"].push_back(fateOf(element, "changed", {element}));
    stage["accounts"].push_back(
        {{"change", "changed"},
         {"identifier", "ID-" + name},
         {"title", title},
         {"properties", {{{"path", "PortNumber"}, {"before", 143}, {"after", 993}}}}});
  }
  return report;
}

TEST(ManyAccountsTest, AreInGroupsThatAreBuiltWhenTheyAreOpenedAndFoundByTheFilter) {
  const std::string page = pageOf(reportOfMany());
  ASSERT_NE(page.find("application/gzip"), std::string::npos);

  const json noted = notedOn(page, R"js(
    note("badge", one(".counts .badge").textContent);
    note("groups", all("#accounts .group").length);
    note("accountsBuilt", all(".account").length);
    note("elements", all("*").length < 5000);
    note("group", all("#accounts .group > summary")[1].innerText);
    all("#accounts .group > summary")[1].click();
    one(".stage > summary").click();
    await pause();
    note("accountsOfGroup", all("#accounts .account").length);
    note("first", one("#accounts .account .title").textContent);
    note("groupsOfStep", all(".stage .group").length);
    note("changesBuilt", all(".stage .change").length);
    await enter("user9876");
    note("found", all(".account .title").map((each) => each.textContent));
    await enter("Account 98");
    note("foundInGroups", all("#accounts .group > summary strong").map((each) => each.textContent));
  )js");

  EXPECT_EQ(noted["badge"], "10,000 changed");
  EXPECT_EQ(noted["groups"], 100);
  EXPECT_EQ(noted["accountsBuilt"], 0);
  EXPECT_EQ(noted["elements"], true);
  EXPECT_EQ(noted["group"], "101 to 200IMAP 'Account 100' … IMAP 'Account 199'");
  EXPECT_EQ(noted["accountsOfGroup"], 100);
  EXPECT_EQ(noted["first"], "IMAP 'Account 100'");
  EXPECT_EQ(noted["groupsOfStep"], 100);
  EXPECT_EQ(noted["changesBuilt"], 0);
  EXPECT_EQ(noted["found"], json({"IMAP 'Account 9876'", "IMAP 'Account 9876'"}));
  // 98, 980 to 989 and 9800 to 9899, and those whose identifier or user has the 98.
  EXPECT_THAT(noted["foundInGroups"].get<std::vector<std::string>>(),
              testing::Contains("101 to 200"));
}

TEST(ManyAccountsTest, AStepLeadsToAnAccountInAGroupThatWasNeverOpened) {
  const json noted = notedOn(pageOf(reportOfMany()), R"js(
    one(".stage > summary").click();
    await pause();
    all(".stage .group > summary")[50].click();
    await pause();
    all(".stage .change > summary")[42].click();
    await pause();
    one(".stage .change button").click();
    await pause();
    note("reached", page.activeElement.querySelector(".title").textContent);
    note("openGroups", all("#accounts .group[open]").length);
  )js");

  EXPECT_EQ(noted["reached"], "IMAP 'Account 5042'");
  EXPECT_EQ(noted["openGroups"], 1);
}

}  // namespace
}  // namespace accounts
