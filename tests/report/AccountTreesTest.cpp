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
                  "SubscribedCalendar 'Public holidays' ✕ not carried over: it was deleted "
                  "(_migrateAccountsFrom7A242:)",
                  "IMAPAccount 'Family' ⇒ converted", "EASAccount 'Office' ⇒ converted"}));
  EXPECT_EQ(noted["after"], json({"OnMyDevice 'My Device'", "Gmail 'Ada at Gmail' ≠ changed",
                                  "CalDAV 'Google calendars' ≠ changed ⇄ moved", "IMAP 'Work'",
                                  "IMAP 'Family' ⇒ converted", "Exchange 'Office' ⇒ converted",
                                  "HostedService 'Velmora' + added"}));
  EXPECT_EQ(noted["parent"], "Gmail 'Ada at Gmail'");
  EXPECT_EQ(noted["source"], "legacy Exchange store");
}

TEST(AccountTreesTest, AnAccountShowsWhichDataclassesItGainedAndLost) {
  const auto dataclass = [](const char* name, bool isEnabled, bool isProvisioned) {
    return json{{"name", name}, {"enabled", isEnabled}, {"provisioned", isProvisioned}};
  };
  json before = standingAt("Accounts[0]", plainAccount("A", "IMAP 'Work'"));
  json after = before;
  before["dataclasses"] = {dataclass("d.Mail", true, true), dataclass("d.Calendars", false, true),
                           dataclass("d.Notes", true, true), dataclass("d.Contacts", true, false)};
  after["dataclasses"] = {dataclass("d.Mail", true, true), dataclass("d.Calendars", true, true),
                          dataclass("d.Contacts", true, true), dataclass("d.Tasks", true, true)};

  const json noted = notedOnTrees(
      {{"accountsBefore", json::array({before})},
       {"accountsAfter", json::array({after})},
       {"ledger",
        {{"accounts", json::array({fateOf("Accounts[0]", "changed", {"Accounts[0]"})})}}}},
      R"js(
    note("before", textsIn(one("#before .account"), ".dataclass"));
    note("after", textsIn(one("#after .account"), ".dataclass"));
  )js");

  EXPECT_EQ(noted["before"],
            json({"Mail (enabled, provisioned) ", "Calendars (not enabled, provisioned) ",
                  "− Notes (enabled, provisioned, removed) ",
                  "≠ Contacts (enabled, not provisioned, changed) "}));
  EXPECT_EQ(noted["after"],
            json({"Mail (enabled, provisioned) ", "+ Calendars (enabled, provisioned, added) ",
                  "≠ Contacts (enabled, provisioned, changed) ",
                  "+ Tasks (enabled, provisioned, added) "}));
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

TEST(AccountTreesTest, AccountsAreThoseThatTheLedgerSaysAndNotThoseOfEqualIdentifiers) {
  const json noted =
      notedOnTrees({{"accountsBefore",
                     {standingAt("MailAccounts[0]", plainAccount("A", "Legacy 'First'")),
                      standingAt("Accounts[0]", plainAccount("A", "IMAP 'Second'")),
                      standingAt("Accounts[1]", plainAccount("A", "IMAP 'Third'"))}},
                    {"accountsAfter",
                     {standingAt("Accounts[0]", plainAccount("A", "IMAP 'Third'")),
                      standingAt("Accounts[1]", plainAccount("A", "IMAP 'First'")),
                      standingAt("Accounts[2]", plainAccount("B", "IMAP 'New'"))}},
                    {"ledger",
                     {{"accounts",
                       {fateOf("MailAccounts[0]", "converted", {"Accounts[1]"}),
                        fateOf("Accounts[0]", "notCarriedOver", {}, "its type is unknown"),
                        fateOf("Accounts[1]", "kept", {"Accounts[0]"})}}}}},
                   R"js(
    note("before", tree("before"));
    note("after", tree("after"));
    (await openOn("before", "IMAP 'Third'")).querySelector("button").click();
    await pause();
    note("reached", page.activeElement.closest("#after .account").querySelector(".title").textContent);
  )js");

  EXPECT_EQ(noted["before"],
            json({"Legacy 'First' ⇒ converted",
                  "IMAP 'Second' ✕ not carried over: its type is unknown", "IMAP 'Third'"}));
  EXPECT_EQ(noted["after"],
            json({"IMAP 'Third'", "IMAP 'First' ⇒ converted", "IMAP 'New' + added"}));
  EXPECT_EQ(noted["reached"], "IMAP 'Third'");
}

TEST(AccountTreesTest, WhatWasJoinedRenamedMovedOrMadeAnewIsSaidToBeSo) {
  json parent = standingAt("Accounts[0]", plainAccount("P", "Gmail 'Parent'"));
  parent["children"].push_back(standingAt("Accounts[0].ChildAccounts[0]",
                                          plainAccount("M", "Velmora 'Moved'", {{"Port", 993}})));

  const json noted = notedOnTrees(
      {{"accountsBefore",
        {standingAt("Accounts[0]", plainAccount("P", "Gmail 'Parent'")),
         standingAt("Accounts[1]", plainAccount("M", "Velmora 'Moved'", {{"Port", 143}})),
         standingAt("Accounts[2]", plainAccount("J", "CalDAV 'Joined'")),
         standingAt("Accounts[3]", plainAccount("OLD", "IMAP 'Renamed'")),
         standingAt("Accounts[4]", plainAccount("D", "OnMyDevice 'Device'")),
         standingAt("Accounts[5]", plainAccount("E", "IMAP 'Earlier'"))}},
       {"accountsAfter",
        {parent, standingAt("Accounts[1]", plainAccount("NEW", "IMAP 'Renamed'")),
         standingAt("Accounts[2]", plainAccount("D", "OnMyDevice 'Device'")),
         standingAt("Accounts[3]", plainAccount("E", "IMAP 'Earlier'"))}},
       {"stages",
        json::array(
            {{{"accounts", json::array({{{"change", "changed"}, {"account", "Accounts[3]"}}})}}})},
       {"ledger",
        {{"accounts",
          {fateOf("Accounts[0]", "kept", {"Accounts[0]"}),
           fateOf("Accounts[1]", "movedBelow", {"Accounts[0].ChildAccounts[0]"}),
           fateOf("Accounts[2]", "joined", {"Accounts[0]"}),
           fateOf("Accounts[3]", "renamed", {"Accounts[1]"}),
           fateOf("Accounts[4]", "rebuilt", {"Accounts[2]"}),
           fateOf("Accounts[5]", "carriedOverEarlier", {"Accounts[3]"})}}}}},
      R"js(
    note("before", tree("before"));
    note("after", tree("after"));
    one("#expand").click();
    await pause();
    all(".change button").find((each) => each.textContent === "Show it before").click();
    note("reached", page.activeElement.closest("#before .account").querySelector(".facts dd").textContent);
  )js");

  EXPECT_EQ(noted["before"], json({"Gmail 'Parent'", "Velmora 'Moved' ≠ changed ⇄ moved",
                                   "CalDAV 'Joined' ∪ joined into Gmail 'Parent'",
                                   "IMAP 'Renamed' # renamed", "OnMyDevice 'Device' ↻ made anew",
                                   "IMAP 'Earlier' ✓ carried over by an earlier run"}));
  EXPECT_EQ(noted["after"], json({"Gmail 'Parent'", "Velmora 'Moved' ≠ changed ⇄ moved",
                                  "IMAP 'Renamed' # renamed", "OnMyDevice 'Device' ↻ made anew",
                                  "IMAP 'Earlier' ✓ carried over by an earlier run"}));
  EXPECT_EQ(noted["reached"], "OLD");
}

TEST(AccountTreesTest, WithoutALedgerNobodySaysWhatBecameOfAnAccount) {
  const json account = standingAt("Accounts[0]", plainAccount("A", "IMAP 'Same'"));

  const json noted = notedOnTrees(
      {{"accountsBefore", json::array({account})}, {"accountsAfter", json::array({account})}},
      R"js(
    note("before", tree("before"));
    note("after", tree("after"));
  )js");

  EXPECT_EQ(noted["before"], json::array({"IMAP 'Same'"}));
  EXPECT_EQ(noted["after"], json::array({"IMAP 'Same'"}));
}

}  // namespace
}  // namespace accounts
