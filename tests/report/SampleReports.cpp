#include "tests/report/SampleReports.h"

#include <fstream>

#include "report/HTMLReport.h"

namespace accounts {

nlohmann::json sampleReport() {
  std::ifstream file(SAMPLE_REPORTS_DIRECTORY "/run.json");
  return nlohmann::json::parse(file);
}

std::string pageOf(const nlohmann::json& report) {
  return htmlReport(report.dump());
}

nlohmann::json fateOf(const std::string& element, const std::string& fate,
                      const std::vector<std::string>& now, const std::string& reason) {
  return {{"place", element}, {"fate", fate}, {"now", now}, {"reason", reason}};
}

nlohmann::json standingAt(const std::string& element, nlohmann::json account) {
  account["element"] = element;
  return account;
}

nlohmann::json plainAccount(const std::string& identifier, const std::string& title,
                            const nlohmann::json& properties) {
  return {{"source", "accountSettings"},
          {"place", "1"},
          {"identifier", identifier},
          {"title", title},
          {"type", "IMAP"},
          {"class", "IMAPAccount"},
          {"properties", properties},
          {"children", nlohmann::json::array()}};
}

}  // namespace accounts
