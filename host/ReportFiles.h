#pragma once

#include <optional>
#include <string>
#include <string_view>

#include "commandline/ExitStatus.h"
#include "host/HostOutcome.h"
#include "inspection/PropertyListJSON.h"

namespace accounts {

/// Files of this machine that a report is written to.
struct ReportFiles {
  std::optional<std::string> json;
  std::optional<std::string> html;

  [[nodiscard]] bool areWanted() const { return json || html; }
};

/// Everything that a run or a plan came to as a JSON object (docs/json.md). `command` is the
/// subcommand's name.
JSON fullReport(std::string_view command, const HostOutcome& outcome);

/// Why a report could not be written; none when it could be. To be asked before a migration, which
/// is not run without the report that was asked for.
std::optional<ProgramError> whyNotWritable(const ReportFiles& files);

/// Writes a report; an error for the first file that cannot be written.
std::optional<ProgramError> writeReport(const ReportFiles& files, const JSON& report);

}  // namespace accounts
