#pragma once

#include "host/CommandLine.h"
#include "host/RunReport.h"

namespace accounts {

/// Runs one migration on one device root, in a child process, and reports it; also every error,
/// for this never fails in another way. Touches nothing beneath the root when the plug-in cannot be
/// run.
RunReport runMigration(const RunOptions& options);

}  // namespace accounts
