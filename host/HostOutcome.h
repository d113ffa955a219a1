#pragma once

#include <functional>

#include "host/DeviceOptions.h"
#include "host/PluginRun.h"
#include "host/RunReport.h"
#include "host/StopSignals.h"
#include "report/RecordedMigration.h"

namespace accounts {

/// What a command of the host came to.
struct HostOutcome {
  RunReport report;
  /// Empty unless it was asked for.
  RecordedMigration recorded;
};

/// The outcome of a command that could not run the plug-in.
HostOutcome failedOutcome(const ProgramError& error);
/// The outcome of a command as far as the plug-in decides it.
HostOutcome outcomeOf(PluginOutcome plugin);

/// Opens a device for a command and reports the root with what came of it. A device that cannot be
/// opened is a failed outcome. Signals to stop are minded from before to after.
HostOutcome outcomeOnDevice(
    const DeviceOptions& options,
    const std::function<HostOutcome(const OpenedDevice& device, StopSignals& stop)>& command);

}  // namespace accounts
