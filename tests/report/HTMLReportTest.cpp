#include "report/HTMLReport.h"

#include <gmock/gmock.h>
#include <gtest/gtest.h>

#include <algorithm>
#include <nlohmann/json.hpp>

namespace accounts {
namespace {

using testing::HasSubstr;
using testing::Not;

constexpr std::string_view kReportStart = R"(<script type="application/json" id="report">)";

/// What stands in the page between the report's tags.
std::string embeddedReport(const std::string& page) {
  const std::size_t start = page.find(kReportStart) + kReportStart.size();
  return page.substr(start, page.find("</script>", start) - start);
}

TEST(HTMLReportTest, HoldsTheReportAsItsJSON) {
  const std::string page = htmlReport(R"({"root":"/mnt/image","stages":[]})");

  EXPECT_EQ(embeddedReport(page), R"({"root":"/mnt/image","stages":[]})");
}

TEST(HTMLReportTest, ALongReportIsCompressed) {
  nlohmann::json report;
  for (int number = 0; number < 100000; ++number) {
    report["accountsBefore"].push_back({{"title", "account " + std::to_string(number)}});
  }
  const std::string plain = htmlReport(R"({"accountsBefore":[]})");

  const std::string page = htmlReport(report.dump() + std::string(3 << 20, ' '));

  EXPECT_THAT(page, HasSubstr(R"(<script type="application/gzip" id="report">H4s)"));
  EXPECT_LT(page.size(), plain.size() + report.dump().size() / 4);
  EXPECT_EQ(std::ranges::count(page, '<'), std::ranges::count(plain, '<'));
}

TEST(HTMLReportTest, ATextThatLooksLikeMarkupStaysTheSameTextAndBringsNoTag) {
  const nlohmann::json report = {{"error", "</script><!--<script>alert(1)</script>"}};

  const std::string page = htmlReport(report.dump());

  EXPECT_EQ(nlohmann::json::parse(embeddedReport(page)), report);
  EXPECT_EQ(std::ranges::count(page, '<'), std::ranges::count(htmlReport("{}"), '<'));
}

TEST(HTMLReportTest, NamesNothingThatABrowserWouldFetch) {
  const std::string page = htmlReport("{}");

  for (const char* reference : {"http:", "https:", "src=", "@import", "url(", "<link", "import("}) {
    EXPECT_THAT(page, Not(HasSubstr(reference)));
  }
  EXPECT_THAT(
      page, HasSubstr("default-src 'none'; style-src 'unsafe-inline'; script-src 'unsafe-inline'"));
}

TEST(HTMLReportTest, TheBuildLeavesNoPlaceholder) {
  EXPECT_THAT(htmlReport("{}"), Not(HasSubstr("{{")));
}

TEST(HTMLReportTest, TextsBecomeTextAndNeverMarkup) {
  const std::string page = htmlReport("{}");

  for (const char* markup :
       {"innerHTML", "outerHTML", "insertAdjacentHTML", "document.write", "eval("}) {
    EXPECT_THAT(page, Not(HasSubstr(markup)));
  }
}

}  // namespace
}  // namespace accounts
