#include <gmock/gmock.h>
#include <gtest/gtest.h>

#include "tests/report/Browser.h"
#include "tests/report/SampleReports.h"

namespace accounts {
namespace {

using nlohmann::json;

// The accounts of a side as its tree shows them, and the one with a title.
constexpr std::string_view kTrees = R"js(
  const textsIn = (part, selector) => [...part.querySelectorAll(selector)].map((each) => each.textContent);
  const describe = (part) =>
    [part.querySelector(".title").textContent, ...textsIn(part, "summary .badge")].join(" ");
  const tree = (side) => all(`#${side} .account`).map(describe);
  const accountOn = (side, title) => all(`#${side} .account`).find((part) =>
    part.querySelector(".title").textContent === title);
  const openOn = async (side, title) => {
    const part = accountOn(side, title);
    part.querySelector("summary").click();
    await pause();
    return part;
  };
)js";

json notedOnTrees(const json& report, const std::string& driver) {
  return notedOn(pageOf(report), std::string(kTrees) + driver);
}

TEST(AccountTreesTest, BothSidesListTheirAccountsWithWhatBecameOfThem) {
  const json noted = notedOnTrees(sampleReport(), R"js(
    note("before", tree("before"));
    note("after", tree("after"));
    const child = accountOn("after", "CalDAV 'Google calendars'");
    note("parent", child.parentElement.parentElement.parentElement.querySelector(".title").textContent);
    note("source", accountOn("before", "EASAccount 'Office'").querySelector(".source").textContent);
  )js");

  EXPECT_EQ(noted["before"],
            json({"OnMyDevice 'My Device'", "Gmail 'Ada at Gmail' ≠ changed",
                  "CalDAV 'Google calendars' ≠ changed ⇄ moved", "IMAP 'Work'",
                  "SubscribedCalendar 'Public holidays' − removed",
                  "IMAPAccount 'Family' ⇒ converted", "EASAccount 'Office' ⇒ converted"}));
  EXPECT_EQ(noted["after"], json({"OnMyDevice 'My Device'", "Gmail 'Ada at Gmail' ≠ changed",
                                  "CalDAV 'Google calendars' ≠ changed ⇄ moved", "IMAP 'Work'",
                                  "IMAP 'Family' ⇒ converted", "Exchange 'Office' ⇒ converted",
                                  "HostedService 'Velmora' + added"}));
  EXPECT_EQ(noted["parent"], "Gmail 'Ada at Gmail'");
  EXPECT_EQ(noted["source"], "legacy Exchange store");
}

TEST(AccountTreesTest, AnAccountShowsItsDataclassesAndWhichOfThemChanged) {
  const json noted = notedOnTrees(sampleReport(), R"js(
    note("before", textsIn(accountOn("before", "Gmail 'Ada at Gmail'"), ".dataclass"));
    note("after", textsIn(accountOn("after", "Gmail 'Ada at Gmail'"), ".dataclass"));
  )js");

  EXPECT_EQ(noted["before"], json({"Mail (enabled, provisioned) ",
                                   "Calendars (not enabled, provisioned, changed) "}));
  EXPECT_EQ(noted["after"],
            json({"Mail (enabled, provisioned) ", "Calendars (enabled, provisioned, changed) "}));
}

TEST(AccountTreesTest, AnOpenAccountShowsItsPropertiesWithTheChangedOnesMarked) {
  const json noted = notedOnTrees(sampleReport(), R"js(
    note("builtBefore", all(".account .body").length);
    const before = await openOn("before", "Gmail 'Ada at Gmail'");
    note("builtAfter", all(".account .body").length);
    note("paths", textsIn(before, ".properties th"));
    note("removedValues", textsIn(before, "del"));
    const after = await openOn("after", "Gmail 'Ada at Gmail'");
    note("newValues", textsIn(after, "ins"));
    const unchanged = await openOn("after", "IMAP 'Work'");
    note("nested", textsIn(unchanged, ".properties th").filter((path) => path.startsWith("Rules")));
    note("marksOfUnchanged", unchanged.querySelectorAll("ins, del, tr.changed").length);
  )js");

  EXPECT_EQ(noted["builtBefore"], 0);
  EXPECT_EQ(noted["builtAfter"], 1);
  EXPECT_EQ(noted["paths"], json({"Class", "DisplayName", "Enabled Dataclasses", "Hostname",
                                  "Identifier", "Password", "PortNumber", "Provisioned Dataclasses",
                                  "SSLEnabled", "Type", "Username"}));
  EXPECT_EQ(noted["removedValues"], json({R"(["com.quarx.Dataclass.Mail"])", "\"993\""}));
  EXPECT_EQ(noted["newValues"],
            json({R"(["com.quarx.Dataclass.Mail", "com.quarx.Dataclass.Calendars"])", "993"}));
  EXPECT_EQ(noted["nested"], json({"Rules/Archive/Days", "Rules/Archive/Enabled"}));
  EXPECT_EQ(noted["marksOfUnchanged"], 0);
}

TEST(AccountTreesTest, AnAccountLeadsToItselfOnTheOtherSideAndPointingAtItMarksIt) {
  const json noted = notedOnTrees(sampleReport(), R"js(
    const before = await openOn("before", "CalDAV 'Google calendars'");
    before.querySelector("summary").focus();
    note("partner", textsIn(page, ".account.partner > summary .title"));
    before.querySelector("button").click();
    await pause();
    const reached = page.activeElement.closest("#after .account");
    note("reached", reached.querySelector(".title").textContent);
    note("isOpen", reached.open);
    note("back", textsIn(reached, "button"));
    note("alone", textsIn(await openOn("before", "SubscribedCalendar 'Public holidays'"), "button"));
  )js");

  EXPECT_EQ(noted["partner"], json::array({"CalDAV 'Google calendars'"}));
  EXPECT_EQ(noted["reached"], "CalDAV 'Google calendars'");
  EXPECT_EQ(noted["isOpen"], true);
  EXPECT_EQ(noted["back"], json::array({"Show it before"}));
  EXPECT_EQ(noted["alone"], json::array());
}

TEST(AccountTreesTest, AStepsChangeLeadsToTheAccountAlsoWhenAFilterHidesIt) {
  const json noted = notedOnTrees(sampleReport(), R"js(
    await enter("Convert the Exchange");
    note("hidden", all("#after .account").length);
    all(".stage > summary")[0].click();
    await pause();
    all(".change > summary")[0].click();
    await pause();
    all(".change button").find((each) => each.textContent === "Show it after").click();
    await pause();
    note("reached", page.activeElement.querySelector(".title").textContent);
    note("filter", one("#filter").value);
  )js");

  EXPECT_EQ(noted["hidden"], 0);
  EXPECT_EQ(noted["reached"], "Exchange 'Office'");
  EXPECT_EQ(noted["filter"], "");
}

TEST(AccountTreesTest, AccountsArePairedByIdentifierOrElseByTitleEachWithOneOther) {
  const json same = {{"Port", 143}};
  json anonymous = plainAccount("", "IMAP 'No identifier'", same);
  anonymous["identifier"] = nullptr;
  const json first = plainAccount("A", "IMAP 'First'", same);
  const json second = plainAccount("A", "IMAP 'Second of the same identifier'", same);
  json legacy = plainAccount("A", "Legacy 'First'", same);
  legacy["source"] = "mailStore";

  const json noted = notedOnTrees({{"accountsBefore", {legacy, first, second, anonymous}},
                                   {"accountsAfter", {first, anonymous, anonymous}}},
                                  R"js(
    note("before", tree("before"));
    note("after", tree("after"));
  )js");

  EXPECT_EQ(noted["before"],
            json({"Legacy 'First' − removed", "IMAP 'First'",
                  "IMAP 'Second of the same identifier' − removed", "IMAP 'No identifier'"}));
  EXPECT_EQ(noted["after"],
            json({"IMAP 'First'", "IMAP 'No identifier'", "IMAP 'No identifier' + added"}));
}

TEST(AccountTreesTest, AnAccountThatAloneHasItsNameIsTheSameWithANewIdentifier) {
  const json name = {{"DisplayName", "Ada"}};
  const json children = json::array({plainAccount("CHILD", "IMAP 'Child'")});
  json before = plainAccount("OLD", "IMAP 'Ada'", name);
  before["children"] = children;
  json after = plainAccount("NEW", "IMAP 'Ada'", name);
  after["children"] = children;
  const json change = {{"change", "changed"}, {"identifier", "NEW"}};

  const json noted =
      notedOnTrees({{"accountsBefore", json::array({before})},
                    {"accountsAfter", json::array({after})},
                    {"stages", json::array({{{"accounts", json::array({change})}}})}},
                   R"js(
    note("before", tree("before"));
    note("after", tree("after"));
    one("#expand").click();
    await pause();
    all(".change button").find((each) => each.textContent === "Show it before").click();
    note("reached", page.activeElement.closest("#before .account").querySelector(".facts dd").textContent);
  )js");

  EXPECT_EQ(noted["before"], json({"IMAP 'Ada' # new identifier", "IMAP 'Child'"}));
  EXPECT_EQ(noted["after"], json({"IMAP 'Ada' # new identifier", "IMAP 'Child'"}));
  EXPECT_EQ(noted["reached"], "OLD");
}

TEST(AccountTreesTest, AccountsWithANamesakeAreNotTheSameWithANewIdentifier) {
  const json name = {{"DisplayName", "Ada"}};

  const json noted =
      notedOnTrees({{"accountsBefore", json::array({plainAccount("OLD", "IMAP 'Ada'", name)})},
                    {"accountsAfter", json::array({plainAccount("NEW", "IMAP 'Ada'", name),
                                                   plainAccount("OTHER", "IMAP 'Ada'", name)})}},
                   R"js(
    note("before", tree("before"));
    note("after", tree("after"));
  )js");

  EXPECT_EQ(noted["before"], json::array({"IMAP 'Ada' − removed"}));
  EXPECT_EQ(noted["after"], json({"IMAP 'Ada' + added", "IMAP 'Ada' + added"}));
}

TEST(AccountTreesTest, AChildThatOutlivesItsParentHasMoved) {
  json parent = plainAccount("PARENT", "Velmora 'Parent'");
  const json child = plainAccount("CHILD", "Velmora 'Child'");
  parent["children"].push_back(child);

  const json noted = notedOnTrees(
      {{"accountsBefore", json::array({parent})}, {"accountsAfter", json::array({child})}},
      R"js(
    note("before", tree("before"));
    note("after", tree("after"));
  )js");

  EXPECT_EQ(noted["before"], json({"Velmora 'Parent' − removed", "Velmora 'Child' ⇄ moved"}));
  EXPECT_EQ(noted["after"], json::array({"Velmora 'Child' ⇄ moved"}));
}

}  // namespace
}  // namespace accounts
