#include <gmock/gmock.h>
#include <gtest/gtest.h>

#include "tests/report/Browser.h"
#include "tests/report/SampleReports.h"

namespace accounts {
namespace {

using nlohmann::json;

// Opens the step whose title begins with a text, and the changed accounts in it.
constexpr std::string_view kOpenStep = R"js(
  const stepOf = (start) => all(".stage").find((stage) =>
    stage.querySelector(".title").textContent.startsWith(start));
  const openStep = async (start) => {
    const step = stepOf(start);
    step.querySelector("summary").click();
    await pause();
    step.querySelectorAll(".change > summary").forEach((summary) => summary.click());
    await pause();
    return step;
  };
  const textsIn = (part, selector) => [...part.querySelectorAll(selector)].map((each) => each.textContent);
)js";

json notedWithSteps(const json& report, const std::string& driver) {
  return notedOn(pageOf(report), std::string(kOpenStep) + driver);
}

TEST(StepsTest, TheTimelineListsEveryStepWithResultNumberOfAccountsAndDuration) {
  json report = sampleReport();
  report["stages"][2]["succeeded"] = false;

  const json noted = notedWithSteps(report, R"js(
    note("steps", all(".timeline > li > .stage > summary").slice(0, 4).map((summary) => [
      summary.querySelector(".result .unseen").textContent.trim(),
      summary.querySelector(".title").textContent, summary.querySelector("code").textContent,
      summary.querySelector(".figures > span").textContent, summary.querySelector(".time").textContent]));
    note("count", all(".timeline > li").length);
  )js");

  EXPECT_EQ(noted["count"], 13);
  EXPECT_EQ(
      noted["steps"],
      json({{"succeeded", "Copy the settings file aside", "copySettingsAside", "1 file", "1.1 ms"},
            {"succeeded", "Convert the Exchange accounts", "_migrateExchangeAccounts:", "1 account",
             "2.3 ms"},
            {"failed", "Convert the mail accounts", "_migrateMailAccounts:", "1 account", "1.9 ms"},
            {"succeeded", "Upgrade from version 3: fold Google calendars into Gmail accounts",
             "_migrateAccountsFrom7A241:", "2 accounts", "18 ms"}}));
}

TEST(StepsTest, AStepIsFoldedAndBuiltOnlyWhenItIsOpened) {
  const json noted = notedWithSteps(sampleReport(), R"js(
    note("openBefore", all(".stage[open]").length);
    note("builtBefore", all(".stage .body").length);
    await openStep("Upgrade from version 3");
    note("openAfter", all(".stage[open]").length);
    note("builtAfter", all(".stage > .body").length);
  )js");

  EXPECT_EQ(noted["openBefore"], 0);
  EXPECT_EQ(noted["builtBefore"], 0);
  EXPECT_EQ(noted["openAfter"], 1);
  EXPECT_EQ(noted["builtAfter"], 1);
}

TEST(StepsTest, AnOpenStepShowsEachChangedPropertyBeforeAndAfterAndWhatDiffersInThem) {
  const json noted = notedWithSteps(sampleReport(), R"js(
    const moved = (await openStep("Upgrade from version 3")).querySelector(".change.moved");
    note("title", moved.querySelector(".title").textContent);
    note("rows", [...moved.querySelectorAll("tbody tr")].map((row) => textsIn(row, "th, td")));
    note("removedPieces", textsIn(moved, "del .differs"));
    note("newPieces", textsIn(moved, "ins .differs"));
    note("place", moved.querySelector(".place").textContent);
    const colours = ["del", "ins", "th"].map((tag) =>
      view.getComputedStyle(moved.querySelector(`tbody ${tag}`)).backgroundColor);
    note("coloursDiffer", new Set(colours).size);
  )js");

  EXPECT_EQ(noted["title"], "CalDAV 'Google calendars'");
  EXPECT_EQ(noted["rows"],
            json({{"Class", "MobileCalDAVAccount", "MobileCalDAVChildAccount"},
                  {"Host", "www.google.com", "calendar.google.com"},
                  {"ParentAccountIdentifier", "none", "7F1C2E90-5A4B-4C0D-9E21-0A6B5C4D3E01"}}));
  EXPECT_EQ(noted["removedPieces"], json({"", "www"}));
  EXPECT_EQ(noted["newPieces"], json({"Child", "calendar"}));
  EXPECT_EQ(noted["place"], "Place: 3 → 2.1, below Gmail 'Ada at Gmail'");
  EXPECT_EQ(noted["coloursDiffer"], 3);
}

TEST(StepsTest, AStepThatAddedAnAccountShowsItAndLeadsToItsValues) {
  const json noted = notedWithSteps(sampleReport(), R"js(
    const step = await openStep("Convert the mail accounts");
    note("amount", step.querySelector(".count").textContent);
    note("added", textsIn(step, ".change > summary > .line > *"));
    step.querySelector(".change button").click();
    await pause();
    note("values", textsIn(page.activeElement.closest(".account"), "tbody ins"));
  )js");

  EXPECT_EQ(noted["amount"], "1 account");
  EXPECT_EQ(noted["added"],
            json({"+ added", "IMAP 'Family'", "7F1C2E90-5A4B-4C0D-9E21-0A6B5C4D3E05"}));
  EXPECT_THAT(noted["values"].get<std::vector<std::string>>(), testing::Contains("Family"));
}

TEST(StepsTest, AnotherKindOfValueIsToldFromTheSameText) {
  const json noted = notedWithSteps(sampleReport(), R"js(
    note("port", textsIn(await openStep("Upgrade from version 5"), ".change td"));
  )js");

  EXPECT_EQ(noted["port"], json({"\"993\"", "993"}));
}

TEST(StepsTest, ShowsFilesLogLinesAndWhatChangedBesideTheAccountsInTheStepTheyBelongTo) {
  const json noted = notedWithSteps(sampleReport(), R"js(
    const step = await openStep("Upgrade from version 3");
    note("files", textsIn(step, ".files li"));
    note("log", textsIn(step, ".log li"));
    note("others", textsIn(step, ":scope > .body > .differences tbody tr"));
    const other = await openStep("Upgrade from version 4");
    note("filesOfAnother", textsIn(other, ".files li"));
    note("logOfAnother", textsIn(other, ".log li"));
  )js");

  EXPECT_EQ(noted["files"],
            json({"created /var/mobile/tmp/Accounts.Xa81Qz",
                  "renamed /var/mobile/Library/Preferences/com.quarx.accountsettings.plist"}));
  EXPECT_EQ(
      noted["log"],
      json::array({"console AccountsDataMigrator: folded 'Google calendars' into 'Ada at Gmail'"}));
  EXPECT_EQ(noted["others"], json::array({"Version34"}));
  EXPECT_EQ(noted["filesOfAnother"], json::array());
  EXPECT_EQ(noted["logOfAnother"], json::array());
}

TEST(StepsTest, AStepAndAChangeWithoutAnythingAreShownAllTheSame) {
  const json report = {{"stages", {json::object(), {{"accounts", {json::object()}}}}}};

  const json noted = notedWithSteps(report, R"js(
    all(".stage > summary").forEach((summary) => summary.click());
    await pause();
    all(".change > summary").forEach((summary) => summary.click());
    await pause();
    note("titles", textsIn(page, ".title"));
    note("empty", textsIn(page, ".stage > .body > p"));
  )js");

  EXPECT_EQ(noted["titles"], json({"a step", "a step", "an account"}));
  EXPECT_EQ(noted["empty"], json::array({"Nothing to show."}));
}

}  // namespace
}  // namespace accounts
