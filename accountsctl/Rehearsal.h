#pragma once

#include <string>

#include "accountsctl/DevicePlatform.h"
#include "inspection/PropertyListJSON.h"
#include "inspection/StoreLayout.h"
#include "platform/DeviceSnapshot.h"
#include "safetynet/AccountLedger.h"

namespace accounts {

/// The ledger of a migration that was made in memory, as a run makes it, and of which nothing is
/// written; or why a run would fail.
using Rehearsed = OrProgramError<AccountLedger>;

/// Rehearses the migration of a device.
Rehearsed rehearse(LinuxPlatform& linux, const DeviceSnapshot& snapshot);

/// Rehearses the migration of a device that has one file alone: account settings or a legacy store.
/// `name` is what the ledger calls the file. A value that no settings file can hold is malformed
/// input.
Rehearsed rehearseFile(DevicePlatform& device, FileKind kind, const PropertyValue& content,
                       const std::string& name);

/// The ledger for the object of a subcommand; null when there is none.
JSON ledgerObject(const Rehearsed& rehearsed);

/// Why it would fail, or what would not be carried over, a line each; empty for nothing.
std::string linesOf(const Rehearsed& rehearsed);

}  // namespace accounts
