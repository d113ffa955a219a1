#pragma once

#include <functional>
#include <optional>
#include <string>
#include <variant>

#include "commandline/ExitStatus.h"
#include "host/PluginBundle.h"
#include "host/RunReport.h"
#include "host/StopSignals.h"
#include "platform/Platform.h"
#include "platform/linux/LinuxPlatform.h"
#include "propertylist/SecretKeys.h"
#include "report/RecordedMigration.h"
#include "safetynet/AccountFiles.h"

namespace accounts {

/// A run of the plug-in that is about to be made.
struct PluginRun {
  const PluginBundle& bundle;
  /// What the plug-in is given; the broadcasts that it makes are those of `linux`.
  Platform platform;
  LinuxPlatform& linux;
  const AccountFiles& files;
  /// How values are recorded; none for a run that is not recorded.
  std::optional<Secrets> recorded;
  /// Looks at what came of it, still in the plug-in's process; none for nothing.
  std::function<void(const Platform& platform, RunReport& report)> inspect;
};

/// What came of a run.
struct PluginOutcome {
  /// The plug-in's report; an error when it ended the process.
  std::variant<RunReport, ProgramError> report;
  /// Empty unless it was asked for.
  RecordedMigration recorded;
};

/// Loads the plug-in and lets it migrate in a child process, so that whatever ends it leaves
/// someone to report it; stops it as runInChildProcess() says.
PluginOutcome runPluginInChild(const PluginRun& run, StopSignals& stop);

/// The report of a run, also of one that gave an error alone.
RunReport reportOf(std::variant<RunReport, ProgramError> outcome);

}  // namespace accounts
