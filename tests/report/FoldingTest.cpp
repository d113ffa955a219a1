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
    note("propertiesWithin", all(".account .properties").length);
    one("#fold").click();
    await pause();
    note("openAfterwards", all("details[open]").length);
  )js");

  // 13 steps with 7 changed accounts, and 7 accounts on both sides.
  EXPECT_EQ(noted["parts"], 13 + 7 + 14);
  EXPECT_EQ(noted["open"], noted["parts"]);
  EXPECT_EQ(noted["changesWithin"], 3);
  EXPECT_EQ(noted["propertiesWithin"], 14);
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

}  // namespace
}  // namespace accounts
