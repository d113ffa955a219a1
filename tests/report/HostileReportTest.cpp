#include <gmock/gmock.h>
#include <gtest/gtest.h>

#include "report/HTMLReport.h"
#include "tests/report/Browser.h"
#include "tests/report/SampleReports.h"

namespace accounts {
namespace {

using nlohmann::json;

/// A report in which one text stands wherever a report can hold one.
json reportFullOf(const std::string& text) {
  json account = plainAccount(text, text, {{text, text}, {"List", {text, {{text, text}}}}});
  account["type"] = text;
  account["class"] = text;
  account["source"] = text;
  account["place"] = text;
  account["dataclasses"] = {{{"name", text}, {"enabled", true}, {"provisioned", true}}};
  const json where = {{"place", text}, {"parent", text}};
  json other = account;
  other["properties"] = {{text, "another"}};
  return {{"command", text},
          {"root", text},
          {"time", text},
          {"result", true},
          {"error", text},
          {"warnings", {text}},
          {"keptInputs", {text}},
          {"broadcasts", {{{"application", text}, {"key", text}}}},
          {"versions", {{"before", text}, {"after", text}}},
          {"stages",
           {{{"name", text},
             {"title", text},
             {"accounts",
              {{{"change", text},
                {"identifier", text},
                {"title", text},
                {"before", where},
                {"after", where},
                {"properties", {{{"path", text}, {"before", text}, {"after", {text}}}}}}}},
             {"otherProperties", {{{"path", text}, {"after", text}}}},
             {"files", {{{"action", text}, {"path", text}}}},
             {"log", {{{"to", text}, {"text", text}}}}}}},
          {"accountsBefore", {account}},
          {"accountsAfter", {other}}};
}

// Opens and filters everything, so that every text of the report has been shown, and looks for what
// a text could have brought with it.
constexpr std::string_view kShowEverything = R"js(
  note("tags", [...new Set(all("*").map((each) => each.localName))].filter((name) =>
    ["img", "iframe", "svg", "object", "embed", "link", "base", "form"].includes(name)));
  one("#expand").click();
  await pause();
  note("folded", all("details:not([open])").length);
  await enter("a");
  note("scripts", all("script").length);
  note("wasRun", view.wasRun === true || window.wasRun === true);
  note("tagsLater", all("img, iframe, svg, object, embed, link, base, form").length);
  note("addresses", all("[href], [src], [onerror], [onclick]").length);
)js";

void expectNothingWasBrought(const json& noted) {
  EXPECT_EQ(noted["tags"], json::array());
  EXPECT_EQ(noted["folded"], 0);
  EXPECT_EQ(noted["scripts"], 2);
  EXPECT_EQ(noted["wasRun"], false);
  EXPECT_EQ(noted["tagsLater"], 0);
  // The link that skips to the content.
  EXPECT_EQ(noted["addresses"], 1);
}

TEST(HostileReportTest, MarkupAndScriptsInAnyTextAreShownAndDoNothing) {
  const std::string hostile =
      R"(</script></style><!--<script>wasRun=true</script><img src=a onerror="wasRun=true">)"
      R"(<svg onload=wasRun=true>"'`${wasRun=true}{{script}}&lt;b&gt;)";

  const json noted = notedOn(pageOf(reportFullOf(hostile)), std::string(kShowEverything) + R"js(
    await enter("");
    note("title", one(".stage .title").textContent);
    note("entities", page.body.innerHTML.includes("&amp;lt;b&amp;gt;"));
  )js");

  expectNothingWasBrought(noted);
  EXPECT_EQ(noted["title"], hostile);
  EXPECT_EQ(noted["entities"], true);
}

TEST(HostileReportTest, UnseenCharactersAndHalvesOfCharactersAreShownAsWhatTheyAre) {
  // A line separator, a right-to-left override, a control character and half of a surrogate pair.
  const std::string report = reportFullOf("PLACE").dump();
  std::string replaced;
  const std::string hostile = R"(a\u2028b\u202ec\u0007d\ud800e\u0000f)";
  for (std::size_t at = 0; at < report.size();) {
    const bool isPlace = report.compare(at, 5, "PLACE") == 0;
    replaced += isPlace ? hostile : report.substr(at, 1);
    at += isPlace ? 5 : 1;
  }

  const json noted = notedOn(htmlReport(replaced), std::string(kShowEverything) + R"js(
    await enter("");
    note("title", one(".stage .title").textContent);
  )js");

  expectNothingWasBrought(noted);
  EXPECT_EQ(noted["title"], "a\\u2028b\\u202ec\\u0007d\uFFFDe\\u0000f");
}

TEST(HostileReportTest, NamesThatObjectsHaveAnywayAreOrdinaryKeys) {
  const json properties = {
      {"__proto__", "P"}, {"constructor", "C"}, {"toString", 1}, {"hasOwn", 2}};
  const json account =
      standingAt("constructor", plainAccount("__proto__", "IMAP 'constructor'", properties));

  const json noted = notedOn(
      pageOf({{"accountsBefore", json::array({account})},
              {"accountsAfter", json::array({account})},
              {"ledger",
               {{"accounts", json::array({fateOf("constructor", "kept", {"constructor"})})}}}}),
      R"js(
    one("#expand").click();
    await pause();
    note("rows", all(".account tbody tr").map((each) => each.textContent));
    note("badges", all(".account .badge").length);
    await enter("toString 2");
    note("found", all(".account").length);
  )js");

  EXPECT_EQ(noted["rows"], json({"Identifier__proto__", "TypeIMAP", "ClassIMAPAccount",
                                 "__proto__P", "constructorC", "hasOwn2", "toString1"}));
  EXPECT_EQ(noted["badges"], 0);
  EXPECT_EQ(noted["found"], 1);
}

TEST(HostileReportTest, AValueOfTheWrongKindLeavesTheRestOfTheReportReadable) {
  const json noted =
      notedOn(pageOf({{"result", true},
                      {"root", 7},
                      {"time", "yesterday"},
                      {"warnings", {1, nullptr}},
                      {"versions", {{"before", nullptr}, {"after", 12}}},
                      {"accountsAfter", {{{"title", 5}, {"properties", {{"A", nullptr}}}}}}}),
              R"js(
    note("heading", one("h1").lastChild.textContent);
    note("facts", all("#overview .facts dd").map((fact) => fact.textContent));
    note("account", one(".account .title").textContent);
  )js");

  EXPECT_EQ(noted["heading"], "The accounts were migrated to version 12.");
  EXPECT_EQ(noted["facts"], json({"7", "yesterday", "none → 12"}));
  EXPECT_EQ(noted["account"], "5");
}

}  // namespace
}  // namespace accounts
