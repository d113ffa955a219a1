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

OrProgramError<void> checkWritable(const ReportFiles& files) {
  OrProgramError<void> writable;
  for (const std::optional<std::string>& file : {files.json, files.html}) {
    if (file && writable) {
      writable = checkReplaceable(*file);
    }
  }
  return writable;
}

OrProgramError<void> writeReport(const ReportFiles& files, std::string_view json,
                                 std::string_view page) {
  OrProgramError<void> written;
  if (files.json) {
    written = replaceFile(*files.json, json);
  }
  if (files.html && written) {
    written = replaceFile(*files.html, page);
  }
  return written;
}

}  // namespace accounts
