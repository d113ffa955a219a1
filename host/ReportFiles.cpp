#include "host/ReportFiles.h"

#include "commandline/ReplacedFile.h"
#include "host/CurrentTime.h"
#include "report/HTMLReport.h"

namespace accounts {

JSON fullReport(std::string_view command, const HostOutcome& outcome) {
  JSON report = {{"command", command}, {"time", currentTimeForReports()}};
  report.update(objectOf(outcome.report));
  report["versions"] = outcome.recorded.versions;
  report["stages"] = outcome.recorded.stages;
  report["accountsBefore"] = outcome.recorded.accountsBefore;
  report["accountsAfter"] = outcome.recorded.accountsAfter;
  return report;
}

std::optional<ProgramError> whyNotWritable(const ReportFiles& files) {
  for (const std::optional<std::string>& file : {files.json, files.html}) {
    if (file) {
      if (std::optional<ProgramError> error = whyNotReplaceable(*file)) {
        return error;
      }
    }
  }
  return std::nullopt;
}

std::optional<ProgramError> writeReport(const ReportFiles& files, const JSON& report) {
  if (!files.areWanted()) {
    return std::nullopt;
  }
  const std::string text = lineOf(report);
  std::optional<ProgramError> error;
  if (files.json) {
    error = replaceFile(*files.json, text + "\n");
  }
  if (files.html && !error) {
    error = replaceFile(*files.html, htmlReport(text));
  }
  return error;
}

}  // namespace accounts
