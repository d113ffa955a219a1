#include "host/ReportFiles.h"

#include "commandline/ReplacedFile.h"
#include "host/CurrentTime.h"

namespace accounts {

JSON fullReport(std::string_view command, const RunReport& report,
                const RecordedMigration& recorded) {
  JSON object = {{"command", command}, {"time", currentTimeForReports()}};
  object.update(objectOf(report, LedgerDetail::EveryAccount));
  object["versions"] = recorded.versions;
  object["stages"] = recorded.stages;
  object["accountsBefore"] = recorded.accountsBefore;
  object["accountsAfter"] = recorded.accountsAfter;
  return object;
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

std::optional<ProgramError> writeReport(const ReportFiles& files, std::string_view json,
                                        std::string_view page) {
  std::optional<ProgramError> error;
  if (files.json) {
    error = replaceFile(*files.json, json);
  }
  if (files.html && !error) {
    error = replaceFile(*files.html, page);
  }
  return error;
}

}  // namespace accounts
