#include <gmock/gmock.h>
#include <gtest/gtest.h>

#include "tests/report/Browser.h"
#include "tests/report/SampleReports.h"

namespace accounts {
namespace {

using nlohmann::json;

// The rows as they are read: the account before, the one after, and what became of it.
constexpr std::string_view kRows = R"js(
  const textsIn = (part, selector) => [...part.querySelectorAll(selector)].map((each) => each.textContent);
  const titleOn = (side, row) => row.querySelector(`summary .${side} .title`)?.textContent ?? "-";
  const describe = (row) =>
    [titleOn("before", row), "|", titleOn("after", row), ...textsIn(row, "summary .badge")].join(" ");
  const rows = () => all(".account").map(describe);
  const rowOf = (start) => all(".account").find((row) => describe(row).startsWith(start));
  const open = async (row) => {
    row.querySelector("summary").click();
    await pause();
    return row;
  };
)js";

json notedOnRows(const json& report, const std::string& driver) {
  return notedOn(pageOf(report), std::string(kRows) + driver);
}

TEST(AccountRowsTest, AnAccountStandsBesideWhatBecameOfItAndAGapBesideWhatIsAlone) {
  const json noted = notedOnRows(sampleReport(), R"js(
    note("rows", rows());
    const child = rowOf("- | CalDAV 'Google calendars'");
    note("below", describe(child.parentElement.parentElement.previousElementSibling));
    note("source", rowOf("EASAccount 'Office'").querySelector(".source").textContent);
    const cellsOf = (row) => [".before", ".after"].map((side) => row.querySelector(side).getBoundingClientRect());
    const [before, after] = cellsOf(rowOf("IMAP 'Work'"));
    note("isBeside", before.top === after.top && before.right < after.left);
    const [, removed] = cellsOf(rowOf("SubscribedCalendar"));
    const [, added] = cellsOf(rowOf("- | HostedService"));
    const [, ofChild] = cellsOf(child);
    note("isOneColumn", [removed, added].every(({ left }) => left === after.left));
    note("childBeginsThere", ofChild.left === after.left);
  )js");

  EXPECT_EQ(noted["rows"],
            json({"OnMyDevice 'My Device' | OnMyDevice 'My Device'",
                  "Gmail 'Ada at Gmail' | Gmail 'Ada at Gmail' ≠ changed",
                  "- | CalDAV 'Google calendars' ≠ changed ⇄ moved",
                  "CalDAV 'Google calendars' | - ≠ changed ⇄ moved", "IMAP 'Work' | IMAP 'Work'",
                  "SubscribedCalendar 'Public holidays' | - ✕ not carried over: it was deleted "
                  "(_migrateAccountsFrom7A242:)",
                  "IMAPAccount 'Family' | IMAP 'Family' ⇒ converted",
                  "EASAccount 'Office' | Exchange 'Office' ⇒ converted",
                  "- | HostedService 'Velmora' + added"}));
  EXPECT_EQ(noted["below"], "Gmail 'Ada at Gmail' | Gmail 'Ada at Gmail' ≠ changed");
  EXPECT_EQ(noted["source"], "legacy Exchange store");
  EXPECT_EQ(noted["isBeside"], true);
  EXPECT_EQ(noted["isOneColumn"], true);
  EXPECT_EQ(noted["childBeginsThere"], true);
}

TEST(AccountRowsTest, AnAccountShowsWhichDataclassesItGainedAndLost) {
  const auto dataclass = [](const char* name, bool isEnabled, bool isProvisioned) {
    return json{{"name", name}, {"enabled", isEnabled}, {"provisioned", isProvisioned}};
  };
  json before = standingAt("Accounts[0]", plainAccount("A", "IMAP 'Work'"));
  json after = before;
  before["dataclasses"] = {dataclass("d.Mail", true, true), dataclass("d.Calendars", false, true),
                           dataclass("d.Notes", true, true), dataclass("d.Contacts", true, false)};
  after["dataclasses"] = {dataclass("d.Mail", true, true), dataclass("d.Calendars", true, true),
                          dataclass("d.Contacts", true, true), dataclass("d.Tasks", true, true)};

  const json noted = notedOnRows(
      {{"accountsBefore", json::array({before})},
       {"accountsAfter", json::array({after})},
       {"ledger",
        {{"accounts", json::array({fateOf("Accounts[0]", "changed", {"Accounts[0]"})})}}}},
      R"js(
    note("before", textsIn(page, ".account .before .dataclass"));
    note("after", textsIn(page, ".account .after .dataclass"));
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

TEST(AccountRowsTest, AnOpenRowShowsEqualValuesOnceAndThoseThatDifferBesideEachOther) {
  const json noted = notedOnRows(sampleReport(), R"js(
    note("builtBefore", all(".account .body").length);
    const changed = await open(rowOf("Gmail"));
    note("builtAfter", all(".account .body").length);
    note("columns", textsIn(changed, "thead th"));
    note("paths", textsIn(changed, "tbody th"));
    note("differing", [...changed.querySelectorAll("tr")].filter((row) => row.querySelector("ins"))
      .map((row) => textsIn(row, "th, td")));
    note("equal", textsIn(changed, "td[colspan='2']").slice(0, 3));
    const unchanged = await open(rowOf("IMAP 'Work'"));
    note("nested", textsIn(unchanged, "tbody th").filter((path) => path.startsWith("Rules")));
    note("marksOfUnchanged", unchanged.querySelectorAll("ins, del").length);
    note("place", unchanged.querySelector(".place").textContent);
    note("columnsBesideAGap", textsIn(await open(rowOf("SubscribedCalendar")), "thead th"));
    const child = await open(rowOf("- | CalDAV"));
    note("columnsOfChild", textsIn(child, "thead th"));
    note("placeOfChild", child.querySelector(".place").textContent);
  )js");

  EXPECT_EQ(noted["builtBefore"], 0);
  EXPECT_EQ(noted["builtAfter"], 1);
  EXPECT_EQ(noted["columns"], json({"Property", "Before", "After"}));
  EXPECT_EQ(noted["paths"],
            json({"Identifier", "Type", "Class", "DisplayName", "Enabled Dataclasses", "Hostname",
                  "Password", "PortNumber", "Provisioned Dataclasses", "SSLEnabled", "Username"}));
  EXPECT_EQ(noted["differing"],
            json({{"Enabled Dataclasses", R"(["com.quarx.Dataclass.Mail"])",
                   R"(["com.quarx.Dataclass.Mail", "com.quarx.Dataclass.Calendars"])"},
                  {"PortNumber", "\"993\"", "993"}}));
  EXPECT_EQ(noted["equal"],
            json({"7F1C2E90-5A4B-4C0D-9E21-0A6B5C4D3E01", "Gmail", "GmailAccount"}));
  EXPECT_EQ(noted["nested"], json({"Rules/Archive/Days", "Rules/Archive/Enabled"}));
  EXPECT_EQ(noted["marksOfUnchanged"], 0);
  EXPECT_EQ(noted["place"], "Place: 4 → 3");
  EXPECT_EQ(noted["columnsBesideAGap"], json({"Property", "Before"}));
  EXPECT_EQ(noted["columnsOfChild"], json({"Property", "After"}));
  EXPECT_EQ(noted["placeOfChild"], "Place: 2.1, below Gmail 'Ada at Gmail'");
}

TEST(AccountRowsTest, AnAccountInTwoRowsLeadsFromOneToTheOther) {
  const json noted = notedOnRows(sampleReport(), R"js(
    const before = await open(rowOf("CalDAV 'Google calendars'"));
    note("ways", textsIn(before, "button"));
    before.querySelector("button").click();
    await pause();
    const reached = page.activeElement.closest(".account");
    note("reached", describe(reached));
    note("isOpen", reached.open);
    note("back", textsIn(reached, "button"));
    note("beside", textsIn(await open(rowOf("IMAP 'Work'")), "button"));
    note("alone", textsIn(await open(rowOf("SubscribedCalendar")), "button"));
  )js");

  EXPECT_EQ(noted["ways"], json::array({"Show it after"}));
  EXPECT_EQ(noted["reached"], "- | CalDAV 'Google calendars' ≠ changed ⇄ moved");
  EXPECT_EQ(noted["isOpen"], true);
  EXPECT_EQ(noted["back"], json::array({"Show it before"}));
  EXPECT_EQ(noted["beside"], json::array());
  EXPECT_EQ(noted["alone"], json::array());
}

TEST(AccountRowsTest, AStepsChangeLeadsToTheAccountAlsoWhenAFilterHidesIt) {
  const json noted = notedOnRows(sampleReport(), R"js(
    await enter("Convert the Exchange");
    note("hidden", all(".account").length);
    all(".stage > summary")[0].click();
    await pause();
    all(".change > summary")[0].click();
    await pause();
    all(".change button").find((each) => each.textContent === "Show it").click();
    await pause();
    note("reached", describe(page.activeElement.closest(".account")));
    note("filter", one("#filter").value);
  )js");

  EXPECT_EQ(noted["hidden"], 0);
  EXPECT_EQ(noted["reached"], "EASAccount 'Office' | Exchange 'Office' ⇒ converted");
  EXPECT_EQ(noted["filter"], "");
}

TEST(AccountRowsTest, AccountsAreThoseThatTheLedgerSaysAndNotThoseOfEqualIdentifiers) {
  const json noted =
      notedOnRows({{"accountsBefore",
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
    note("rows", rows());
  )js");

  // In the order before; what is alone after stands below what it follows there.
  EXPECT_EQ(noted["rows"],
            json({"Legacy 'First' | IMAP 'First' ⇒ converted", "- | IMAP 'New' + added",
                  "IMAP 'Second' | - ✕ not carried over: its type is unknown",
                  "IMAP 'Third' | IMAP 'Third'"}));
}

TEST(AccountRowsTest, WhatWasJoinedRenamedMovedOrMadeAnewIsSaidToBeSo) {
  json parent = standingAt("Accounts[0]", plainAccount("P", "Gmail 'Parent'"));
  parent["children"].push_back(standingAt("Accounts[0].ChildAccounts[0]",
                                          plainAccount("M", "Velmora 'Moved'", {{"Port", 993}})));

  const json noted = notedOnRows(
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
    note("rows", rows());
    one("#expand").click();
    await pause();
    all(".change button").find((each) => each.textContent === "Show it").click();
    await pause();
    note("reached", describe(page.activeElement.closest(".account")));
    note("identifiers", textsIn(page.activeElement.closest(".account").querySelector("tr:has(ins)"), "td"));
  )js");

  EXPECT_EQ(noted["rows"],
            json({"Gmail 'Parent' | Gmail 'Parent'", "- | Velmora 'Moved' ≠ changed ⇄ moved",
                  "Velmora 'Moved' | - ≠ changed ⇄ moved",
                  "CalDAV 'Joined' | - ∪ joined into Gmail 'Parent'",
                  "IMAP 'Renamed' | IMAP 'Renamed' # renamed",
                  "OnMyDevice 'Device' | OnMyDevice 'Device' ↻ made anew",
                  "IMAP 'Earlier' | IMAP 'Earlier' ✓ carried over by an earlier run"}));
  EXPECT_EQ(noted["reached"], "IMAP 'Renamed' | IMAP 'Renamed' # renamed");
  EXPECT_EQ(noted["identifiers"], json({"OLD", "NEW"}));
}

TEST(AccountRowsTest, WithoutALedgerNobodySaysWhatBecameOfAnAccount) {
  const json account = standingAt("Accounts[0]", plainAccount("A", "IMAP 'Same'"));

  const json noted = notedOnRows(
      {{"accountsBefore", json::array({account})}, {"accountsAfter", json::array({account})}},
      R"js(
    note("rows", rows());
  )js");

  EXPECT_EQ(noted["rows"], json({"- | IMAP 'Same'", "IMAP 'Same' | -"}));
}

}  // namespace
}  // namespace accounts
