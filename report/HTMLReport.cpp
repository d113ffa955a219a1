#include "report/HTMLReport.h"

#include "report/ReportPage.h"

namespace accounts {
namespace {

// In JSON a "<" stands only within texts, where its escape means the same. Without one nothing can
// end the element that the JSON stands in, nor begin a comment there.
constexpr char kTagStart = '<';
constexpr std::string_view kEscapedTagStart = "\\u003c";

void appendEscaped(std::string& page, std::string_view json) {
  for (const char character : json) {
    if (character == kTagStart) {
      page += kEscapedTagStart;
    } else {
      page += character;
    }
  }
}

}  // namespace

std::string htmlReport(std::string_view reportJSON) {
  std::string page;
  page.reserve(reportPage.beforeReport.size() + reportJSON.size() + reportPage.afterReport.size());
  page += reportPage.beforeReport;
  appendEscaped(page, reportJSON);
  page += reportPage.afterReport;
  return page;
}

}  // namespace accounts
