#pragma once

#include <optional>
#include <string>

#include "accountsctl/CommandResult.h"
#include "accountsctl/CommandWorker.h"
#include "commandline/Terminal.h"

namespace accounts {

struct StatusOptions {
  /// The directory that holds the device.
  std::string root;
  /// A device path; none for the platform's own.
  std::optional<std::string> home;
  /// The device description; none for the root's own.
  std::optional<std::string> device;
  /// The plug-in's bundle; none for that of the program.
  std::optional<std::string> bundle;
  bool reportsJSON = false;
  bool failsIfPending = false;
};

/// Tells what a migration would find on a device and do. Changes nothing, and reads nothing outside
/// the root but the bundle's resources and a device description that is named. The exit status of
/// the report is ExitStatus::Attention if that is asked for and something is pending.
CommandResult status(const StatusOptions& options, const Terminal& terminal,
                     const CommandWorker& worker);

}  // namespace accounts
