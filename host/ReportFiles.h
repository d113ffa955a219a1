#pragma once

#include <optional>
#include <string>
#include <string_view>

#include "commandline/ExitStatus.h"
#include "host/RunReport.h"
#include "inspection/PropertyListJSON.h"
#include "report/RecordedMigration.h"

namespace accounts {

/// Files of this machine that a report is written to.
struct ReportFiles {
  std::optional<std::string> json;
  std::optional<std::string> html;

  [[nodiscard]] bool areWanted() const { return json || html; }
};

/// Everything that a run or a plan came to as a JSON object (docs/json.md). `command` is the
/// subcommand's name.
JSON fullReport(std::string_view command, const RunReport& report,
                const RecordedMigration& recorded);

/// An error when a report could not be written. To be asked before a migration, which is not run
/// without the report that was asked for.
OrProgramError<void> checkWritable(const ReportFiles& files);

/// Writes a report, as the bytes of each file that is wanted; an error for the first that cannot be
/// written.
OrProgramError<void> writeReport(const ReportFiles& files, std::string_view json,
                                 std::string_view page);

}  // namespace accounts
