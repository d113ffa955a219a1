#pragma once

#include <optional>
#include <string>

#include "host/RunReport.h"

namespace accounts {

/// One run of the plug-in. Paths belong to the machine that the host runs on, except those called
/// device paths, which start at the root of the device.
struct RunOptions {
  std::string root;
  /// A device path; none for the platform's own.
  std::optional<std::string> home;
  /// None for the root's own description.
  std::optional<std::string> deviceDescription;
  /// None for the bundle beside the program.
  std::optional<std::string> plugin;
  /// A device path; none for the one in the home directory.
  std::optional<std::string> temporaryDirectory;
  /// Where the log channel goes, "-" for standard error; none keeps the channel off.
  std::optional<std::string> channel;
  /// Runs the plug-in without the safety net.
  bool bare = false;
};

/// Runs one migration on one device root, in a child process, and reports it; also every error,
/// for this never fails in another way. Touches nothing beneath the root when the plug-in cannot be
/// run.
RunReport runMigration(const RunOptions& options);

}  // namespace accounts
