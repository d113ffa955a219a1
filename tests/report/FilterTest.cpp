#include <gmock/gmock.h>
#include <gtest/gtest.h>

#include "tests/report/Browser.h"
#include "tests/report/SampleReports.h"

namespace accounts {
namespace {

using nlohmann::json;

// What the page shows, in short: the titles of steps and of accounts on both sides.
constexpr std::string_view kShown = R"js(
  const titles = (selector) => all(selector).map((each) => each.textContent);
  const shownNow = () => ({ steps: all(".stage").length, before: titles(".account .before .title"),
                            after: titles(".account .after .title") });
  const opened = () => titles(".account[open] .title");
)js";

json notedWhileFiltering(const std::string& driver) {
  return notedOn(pageOf(sampleReport()), std::string(kShown) + driver);
}

TEST(FilterTest, FindsTitlesIdentifiersPropertyNamesAndValuesWhateverTheCase) {
  const json noted = notedWhileFiltering(R"js(
    await enter("wORK");
    note("title", shownNow());
    await enter("5C4D3E03");
    note("identifier", shownNow());
    await enter("rules/archive");
    note("path", shownNow());
    await enter("Archive");
    note("name", shownNow());
    await enter("imap.work.example");
    note("value", shownNow());
    await enter("work IMAP 143");
    note("words", shownNow());
  )js");

  const json work = {{"steps", 0}, {"before", {"IMAP 'Work'"}}, {"after", {"IMAP 'Work'"}}};
  for (const char* by : {"title", "identifier", "name", "value", "words", "path"}) {
    EXPECT_EQ(noted[by], work) << by;
  }
}

TEST(FilterTest, SaysHowMuchIsShownAndMarksTheWords) {
  const json noted = notedWhileFiltering(R"js(
    note("none", one("#shown").textContent);
    await enter("calendar.google");
    note("some", one("#shown").textContent);
    note("role", one("#shown").getAttribute("role"));
    note("marks", [...new Set(all("mark").map((mark) => mark.textContent))]);
    await enter("nothing has this");
    note("nothing", one("#shown").textContent);
    note("texts", all("#steps .content, #accounts .content").map((each) => each.textContent));
  )js");

  EXPECT_EQ(noted["none"], "");
  EXPECT_EQ(noted["some"], "Shown: 1 of 13 steps, 0 of 7 accounts before, 1 of 7 after");
  EXPECT_EQ(noted["role"], "status");
  EXPECT_EQ(noted["marks"], json::array({"calendar.google"}));
  EXPECT_EQ(noted["nothing"], "Shown: 0 of 13 steps, 0 of 7 accounts before, 0 of 7 after");
  EXPECT_EQ(noted["texts"], json({"None to show.", "None to show."}));
}

TEST(FilterTest, FewMatchesAreOpenedToWhereTheWordsAre) {
  const json noted = notedWhileFiltering(R"js(
    await enter("folded 'Google");
    note("log", all(".stage[open] .log mark").length > 0);
    note("changes", all(".stage .change").length);
    await enter("Archive");
    note("property", all(".account[open] th mark").map((each) => each.textContent));
    await enter("IMAP 'Work'");
    note("inTitle", all(".account[open]").length);
  )js");

  EXPECT_EQ(noted["log"], true);
  EXPECT_EQ(noted["changes"], 0);
  EXPECT_EQ(noted["property"], json({"Archive", "Archive"}));
  EXPECT_EQ(noted["inTitle"], 0);
}

TEST(FilterTest, AChildThatMatchesIsShownBelowItsParent) {
  const json noted = notedWhileFiltering(R"js(
    await enter("MobileCalDAVChildAccount");
    note("after", shownNow().after);
    note("open", opened());
  )js");

  EXPECT_EQ(noted["after"], json({"Gmail 'Ada at Gmail'", "CalDAV 'Google calendars'"}));
  EXPECT_EQ(noted["open"], json::array({"CalDAV 'Google calendars'"}));
}

TEST(FilterTest, OnlyWhatChangedLeavesChangedAccountsStepsAndProperties) {
  const json noted = notedWhileFiltering(R"js(
    one("#changed-only").click();
    await pause();
    const changed = shownNow();
    note("before", changed.before);
    note("steps", changed.steps);
    all(".account > summary")[0].click();
    await pause();
    note("properties", all(".account tbody th").map((each) => each.textContent));
    await enter("office");
    note("withWords", shownNow());
    one("#changed-only").click();
    await enter("");
    const everything = shownNow();
    note("everything", [everything.steps, everything.before.length, everything.after.length]);
  )js");

  EXPECT_EQ(noted["before"], json({"Gmail 'Ada at Gmail'", "CalDAV 'Google calendars'",
                                   "SubscribedCalendar 'Public holidays'", "IMAPAccount 'Family'",
                                   "EASAccount 'Office'"}));
  // Without the five upgrade steps that only put their version on the file.
  EXPECT_EQ(noted["steps"], 8);
  EXPECT_EQ(noted["properties"], json({"Enabled Dataclasses", "PortNumber"}));
  EXPECT_EQ(
      noted["withWords"],
      json({{"steps", 1}, {"before", {"EASAccount 'Office'"}}, {"after", {"Exchange 'Office'"}}}));
  EXPECT_EQ(noted["everything"], json({13, 7, 7}));
}

TEST(FilterTest, ACountOfAccountsShowsTheseAloneUntilItIsPressedAgain) {
  const json noted = notedWhileFiltering(R"js(
    const chip = (words) => all(".counts button").find((each) => each.textContent === words);
    chip("2 converted").click();
    note("converted", shownNow());
    note("pressed", all(".counts [aria-pressed=true]").map((each) => each.textContent));
    chip("2 unchanged").click();
    note("unchanged", shownNow());
    chip("2 unchanged").click();
    const everything = shownNow();
    note("everything", [everything.steps, everything.before.length, everything.after.length]);
    note("pressedAtLast", all(".counts [aria-pressed=true]").length);
  )js");

  EXPECT_EQ(noted["converted"], json({{"steps", 0},
                                      {"before", {"IMAPAccount 'Family'", "EASAccount 'Office'"}},
                                      {"after", {"IMAP 'Family'", "Exchange 'Office'"}}}));
  EXPECT_EQ(noted["pressed"], json::array({"2 converted"}));
  EXPECT_EQ(noted["unchanged"]["before"], json({"OnMyDevice 'My Device'", "IMAP 'Work'"}));
  EXPECT_EQ(noted["unchanged"]["after"], json({"OnMyDevice 'My Device'", "IMAP 'Work'"}));
  EXPECT_EQ(noted["everything"], json({13, 7, 7}));
  EXPECT_EQ(noted["pressedAtLast"], 0);
}

TEST(FilterTest, ASlashGoesToTheFilterAndIsTextWithinIt) {
  const json noted = notedWhileFiltering(R"js(
    press("/");
    note("focused", page.activeElement.id);
    const event = new view.KeyboardEvent("keydown", { key: "/", bubbles: true, cancelable: true });
    one("#filter").dispatchEvent(event);
    note("isTaken", event.defaultPrevented);
  )js");

  EXPECT_EQ(noted["focused"], "filter");
  EXPECT_EQ(noted["isTaken"], false);
}

TEST(FilterTest, WhatAPersonOpenedStaysOpenWhileTheFilterChanges) {
  const json noted = notedWhileFiltering(R"js(
    all(".account > summary")[4].click();
    await pause();
    await enter("Work");
    note("stays", opened());
    all(".account[open] > summary")[0].click();
    await enter("");
    note("closed", opened());
  )js");

  EXPECT_EQ(noted["stays"], json({"IMAP 'Work'", "IMAP 'Work'"}));
  EXPECT_EQ(noted["closed"], json::array());
}

}  // namespace
}  // namespace accounts
