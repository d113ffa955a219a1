#pragma once

#include <string>

#include "accountsctl/CommandResult.h"
#include "accountsctl/CommandWorker.h"
#include "commandline/Terminal.h"

namespace accounts {

struct FrameworkCheckOptions {
  /// A file of this machine.
  std::string file;
  bool reportsJSON = false;
};

/// Loads a framework as a device does and says what it exports, which classes it registers and what
/// these answer. The exit status of the report is ExitStatus::Attention when something of it is not
/// as it should be. What a device would refuse to load is an error. The framework's own code runs.
CommandResult checkFramework(const FrameworkCheckOptions& options, const Terminal& terminal,
                             const CommandWorker& worker);

}  // namespace accounts
