#include <gmock/gmock.h>
#include <gtest/gtest.h>

#include "report/HTMLReport.h"
#include "tests/report/Browser.h"
#include "tests/report/SampleReports.h"

namespace accounts {
namespace {

using nlohmann::json;

/// The sentence that a report begins with, for each of several reports.
std::vector<std::string> sentencesOf(const json& reports) {
  // The page's own functions, asked for one report after the other: a browser for each would be
  // slow.
  const json noted = notedOn(pageOf(json::object()), "const reports = " + reports.dump() + R"js(;
    note("sentences", reports.map((report) => {
      const heading = view.document.createElement("div");
      heading.append(...view.overview(report, view.accountsOf(report)).filter((each) => each));
      heading.querySelector(".sign").remove();
      return heading.querySelector("h1").textContent;
    }));
  )js");
  return noted.value("sentences", std::vector<std::string>());
}

TEST(OverviewTest, OneSentenceSaysWhatCameOfARunOrAPlan) {
  const json account = json::array({standingAt("Accounts[0]", plainAccount("A", "Work"))});
  const auto ledger = [](const char* fate) {
    return json{{"accounts", json::array({fateOf("Accounts[0]", fate, {"Accounts[0]"})})}};
  };
  const json upgrade = {{"before", 3}, {"after", 12}};
  const json current = {{"before", 12}, {"after", 12}};
  const json none = {{"before", nullptr}, {"after", 12}};

  const auto succeeded = [](const char* command, const json& versions, json more = json::object()) {
    more.update(
        {{"command", command}, {"result", true}, {"exitStatus", 0}, {"versions", versions}});
    return more;
  };
  const auto withLedger = [&](const char* fate) {
    return json{{"accountsBefore", account}, {"accountsAfter", account}, {"ledger", ledger(fate)}};
  };

  const std::vector<std::string> sentences = sentencesOf(json::array({
      succeeded("run", upgrade),
      succeeded("run", none),
      succeeded("run", current, withLedger("kept")),
      succeeded("run", current, withLedger("changed")),
      succeeded("run", current),
      {{"command", "run"}, {"result", true}, {"exitStatus", 2}, {"versions", upgrade}},
      {{"command", "run"}, {"result", false}, {"exitStatus", 1}, {"versions", upgrade}},
      {{"command", "run"}, {"result", true}, {"exitStatus", 74}},
      succeeded("plan", upgrade),
      succeeded("plan", current, {{"ledger", ledger("kept")}}),
      {{"command", "plan"}, {"result", false}, {"exitStatus", 1}},
      json::object(),
  }));

  EXPECT_THAT(
      sentences,
      testing::ElementsAre("The accounts were migrated from version 3 to 12.",
                           "The accounts were migrated to version 12.",
                           "The migration succeeded and changed no account.",
                           "The accounts were migrated; their version stays 12.",
                           "The accounts were migrated; their version stays 12.",
                           "The result could not be verified, so nothing was changed.",
                           "The migration failed.", "The migration failed.",
                           "A migration would bring the accounts up to date from version 3 to 12.",
                           "A migration would change no account.", "A migration would fail.",
                           "The migration failed."));
}

TEST(OverviewTest, ShowsTheFactsWarningsKeptInputsAndAnnouncements) {
  const json noted = notedOn(pageOf(sampleReport()), R"js(
    note("title", page.title);
    note("badges", all(".counts .badge").map((badge) => badge.textContent));
    note("facts", all("#overview .facts > div").map((fact) => fact.textContent));
    note("notices", all(".notice").map((notice) => notice.innerText));
    note("announcements", all(".announcements li").map((line) => line.textContent));
  )js");

  EXPECT_EQ(noted["title"], "Report of a migration: /mnt/image");
  EXPECT_EQ(noted["badges"], json({"1 added", "2 changed", "1 moved", "2 converted",
                                   "1 not carried over", "2 unchanged"}));
  EXPECT_EQ(noted["facts"], json({"Root/mnt/image", "Time2026-11-21 22:10:00 UTC", "Version3 → 12",
                                  "Took33 ms", "Exit status3"}));
  ASSERT_EQ(noted["notices"].size(), 3U);
  EXPECT_THAT(noted["notices"][0].get<std::string>(), testing::StartsWith("Not carried over\n"));
  EXPECT_THAT(noted["notices"][1].get<std::string>(), testing::StartsWith("Warning\n"));
  EXPECT_EQ(noted["notices"][2],
            "Kept inputs\n/var/mobile/Library/AccountMigration/Kept-20261121T221000Z");
  EXPECT_EQ(noted["announcements"], json({"com.quarx.mobilemail was told that MailAccounts changed",
                                          "Cloud tabs were announced once"}));
}

TEST(OverviewTest, APlanSaysWhomAMigrationWouldTell) {
  json plan = sampleReport();
  plan["command"] = "plan";

  const json noted = notedOn(pageOf(plan), R"js(
    note("title", page.title);
    note("announcements", all(".announcements li").map((line) => line.textContent));
  )js");

  EXPECT_EQ(noted["title"], "Plan of a migration: /mnt/image");
  EXPECT_EQ(noted["announcements"],
            json({"com.quarx.mobilemail would be told that MailAccounts changed",
                  "Cloud tabs would be announced once"}));
}

TEST(OverviewTest, WhatAReportDoesNotHoldIsLeftOut) {
  const json noted =
      notedOn(pageOf({{"result", false}, {"error", "no such root: /mnt/image"}}), R"js(
    note("visible", all("main h1, main h2, main h3, #toolbar")
      .filter((each) => each.checkVisibility()).map((each) => each.textContent));
    note("error", one(".notice.error li").textContent);
  )js");

  EXPECT_EQ(noted["visible"], json({"✕The migration failed.", "Error"}));
  EXPECT_EQ(noted["error"], "no such root: /mnt/image");
}

TEST(OverviewTest, AReportThatIsNoJSONIsSaidToBeUnreadable) {
  const json noted = notedOn(htmlReport(R"({"root": )"), R"js(
    note("heading", one("h1").textContent);
  )js");

  EXPECT_EQ(noted["heading"], "This report cannot be read.");
}

TEST(OverviewTest, WithoutScriptsThePageSaysWhatToDo) {
  const Visit visit = visitPage(pageOf(sampleReport()), R"js(
    note("text", page.body.innerText);
  )js",
                                {.scripts = View::Scripts::forbidden});

  const std::string text = visit.noted.value("text", "");
  EXPECT_THAT(text, testing::HasSubstr("needs JavaScript"));
  EXPECT_THAT(text, testing::HasSubstr("--report FILE"));
}

TEST(OverviewTest, WithScriptsItDoesNot) {
  const json noted = notedOn(pageOf(sampleReport()), R"js(
    note("text", page.body.innerText);
  )js");

  EXPECT_THAT(noted["text"].get<std::string>(), testing::Not(testing::HasSubstr("JavaScript")));
}

}  // namespace
}  // namespace accounts
