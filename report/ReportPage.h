#pragma once

#include <string_view>

namespace accounts {

/// The page of page/report.html with its styles and scripts in it, in two pieces: a report's JSON
/// stands between them. The build makes it (EmbedPage.cmake).
struct ReportPage {
  std::string_view beforeReport;
  std::string_view afterReport;
};

extern const ReportPage reportPage;

}  // namespace accounts
