#pragma once

#include <optional>

#include "host/DeviceOptions.h"
#include "host/HostOutcome.h"
#include "propertylist/SecretKeys.h"

namespace accounts {

/// One run of the plug-in.
struct RunOptions {
  DeviceOptions device;
  /// Runs the plug-in without the safety net.
  bool bare = false;
  /// Whether what the plug-in announces is announced on the system's D-Bus, too.
  bool broadcastsOnDBus = false;
  /// How values are recorded; none for a run that is not recorded.
  std::optional<Secrets> recorded;
};

/// Runs one migration on one device root, in a child process, and reports it; also every error,
/// for this never fails in another way. Touches nothing beneath the root when the plug-in cannot be
/// run.
HostOutcome runMigration(const RunOptions& options);

}  // namespace accounts
