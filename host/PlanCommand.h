#pragma once

#include "host/DeviceOptions.h"
#include "host/HostOutcome.h"
#include "propertylist/SecretKeys.h"

namespace accounts {

/// What a run would do is to be shown.
struct PlanOptions {
  DeviceOptions device;
  Secrets secrets = Secrets::Hide;
};

/// Lets the plug-in migrate the device's files in memory and reports what came of it. Nothing
/// beneath the root is changed. Waits while a host works on the root. What it cannot foresee: a
/// medium without room, directories that may not be written, and unique identifiers, which are
/// other ones in each run.
HostOutcome planMigration(const PlanOptions& options);

}  // namespace accounts
