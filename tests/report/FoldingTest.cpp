#include <gmock/gmock.h>
#include <gtest/gtest.h>

#include "tests/report/Browser.h"
#include "tests/report/SampleReports.h"

namespace accounts {
namespace {

using nlohmann::json;

TEST(FoldingTest, ExpandAllOpensEverythingThereIsAndFoldAllClosesIt) {
  const json noted = notedOn(pageOf(sampleReport()), R"js(
    one("#expand").click();
    await pause();
    note("parts", all("details").length);
    note("open", all("details[open]").length);
    note("changesWithin", all(".stage .change .differences").length);
    note("propertiesWithin", all(".account .values").length);
    one("#fold").click();
    await pause();
    note("openAfterwards", all("details[open]").length);
  )js");

  // 13 steps with 7 changed accounts, and 9 rows of accounts.
  EXPECT_EQ(noted["parts"], 13 + 7 + 9);
  EXPECT_EQ(noted["open"], noted["parts"]);
  EXPECT_EQ(noted["changesWithin"], 3);
  EXPECT_EQ(noted["propertiesWithin"], 9);
  EXPECT_EQ(noted["openAfterwards"], 0);
}

TEST(FoldingTest, OnPaperThereIsTheSummaryAndWhatIsFoldedStaysSo) {
  json properties = json::object();
  for (int number = 0; number < 400; ++number) {
    properties["Key " + std::to_string(number)] = number;
  }
  const json accounts = json::array({plainAccount("A", "IMAP 'Work'", properties)});

  // Unfolded it would be four sheets at least; no sheet has a hundred lines.
  EXPECT_EQ(printedSheets(pageOf({{"accountsAfter", accounts}})), 1U);
}

TEST(FoldingTest, PartsOpenWithTheKeyboardAloneAndShowWhereTheFocusIs) {
  const json noted = notedOn(pageOf(sampleReport()), R"js(
    const focusable = all("a, button, input, summary").filter((each) => each.checkVisibility());
    note("unreachable", focusable.filter((each) => {
      each.focus();
      return page.activeElement !== each;
    }).map((each) => each.outerHTML));
    note("withoutName", focusable.filter((each) => each.textContent.trim() === "" &&
      !each.labels?.length && !each.ariaLabel).length);
    one(".stage > summary").focus();
    note("outline", view.getComputedStyle(page.activeElement).outlineStyle);
    note("skipsTo", one(one(".skip").getAttribute("href")).tagName);
  )js");

  EXPECT_EQ(noted["unreachable"], json::array());
  EXPECT_EQ(noted["withoutName"], 0);
  EXPECT_EQ(noted["outline"], "solid");
  EXPECT_EQ(noted["skipsTo"], "MAIN");
}

// What a reader of screens goes by.
constexpr std::string_view kStructure = R"js(
  const repeated = (list) => list.filter((each, index) => list.indexOf(each) !== index);
  const structure = () => {
    const levels = all("h1, h2, h3, h4, h5, h6").filter((each) => each.checkVisibility())
      .map((each) => Number(each.localName[1]));
    return {
      doubledIds: repeated(all("[id]").map((each) => each.id)),
      namesOfNothing: all("[aria-labelledby], label[for]").filter((each) =>
        one("#" + (each.getAttribute("aria-labelledby") ?? each.htmlFor)) === null).length,
      leapingHeadings: levels.filter((level, index) => level > (levels[index - 1] ?? 0) + 1),
      titles: levels.filter((level) => level === 1).length,
      strangersInLists: all("ul > *, ol > *").filter((each) => each.localName !== "li").length +
        all("li").filter((each) => !["ul", "ol"].includes(each.parentElement.localName)).length,
      cellsWithoutHeading: all("td").filter((each) =>
        each.parentElement.querySelector("th[scope=row]") === null).length,
      tablesWithoutHeadings: all("table").filter((each) => each.querySelector("th[scope=col]") === null).length,
      reachableButHidden: all("[aria-hidden=true] :is(a, button, input, summary)").length,
      contentOutsideLandmarks: [...page.body.children].filter((each) => !["MAIN", "SCRIPT", "NOSCRIPT"]
        .includes(each.tagName) && !each.matches(".skip")).length,
      language: page.documentElement.lang,
    };
  };
)js";

TEST(FoldingTest, FoldedOrNotAReaderOfScreensFindsNamesHeadingsAndCells) {
  const json noted = notedOn(pageOf(sampleReport()), std::string(kStructure) + R"js(
    note("folded", structure());
    one("#expand").click();
    await pause();
    note("unfolded", structure());
    note("tables", all("table").length);
  )js");

  const json sound = {{"doubledIds", json::array()},
                      {"namesOfNothing", 0},
                      {"leapingHeadings", json::array()},
                      {"titles", 1},
                      {"strangersInLists", 0},
                      {"cellsWithoutHeading", 0},
                      {"tablesWithoutHeadings", 0},
                      {"reachableButHidden", 0},
                      {"contentOutsideLandmarks", 0},
                      {"language", "en"}};
  EXPECT_EQ(noted["folded"], sound);
  EXPECT_EQ(noted["unfolded"], sound);
  EXPECT_GT(noted["tables"], 9);
}

}  // namespace
}  // namespace accounts
