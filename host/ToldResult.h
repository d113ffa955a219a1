#pragma once

#include <optional>
#include <string>
#include <string_view>
#include <vector>

#include "host/RunCommand.h"
#include "host/RunReport.h"
#include "report/RecordedMigration.h"
#include "safetynet/MigrationRun.h"

namespace accounts {

/// What a run came to, from the host to the worker that tells of it: as bytes, and back; none when
/// they are no such bytes.
std::string bytesOf(const RunConclusion& conclusion);
std::optional<RunConclusion> conclusionFrom(std::string_view bytes);

/// Whether a report was written, as bytes, and back. Bytes that say nothing stand for success.
std::string bytesOfWriting(const OrProgramError<void>& written);
OrProgramError<void> writingFrom(std::string_view bytes);

/// What people and programs get of a run.
struct ToldResult {
  /// Of standard error: warnings, then the error.
  std::vector<std::string> warnings;
  std::optional<std::string> error;
  /// Of standard output.
  std::string result;
};
ToldResult toldResult(const RunOptions& options, const RunReport& report,
                      const RecordedMigration& recorded);
std::string bytesOf(const ToldResult& told);
std::optional<ToldResult> toldResultFrom(std::string_view bytes);

/// The name of the subcommand that options stand for.
std::string_view commandOf(const RunOptions& options);

/// Notes in a report what the host says of a run, but for the worker's own words.
void note(RunReport& report, const RunConclusion& conclusion, const RunOptions& options);

/// What a person types to put files back, such as "migration-host restore --root / --from Kept-1".
std::string restoreCommand(const DeviceOptions& options, std::string_view folder);

}  // namespace accounts
