#pragma once

#include <optional>
#include <string>

#include "accountsctl/CommandResult.h"
#include "accountsctl/CommandWorker.h"
#include "commandline/Terminal.h"

namespace accounts {

struct CheckOptions {
  /// A file of this machine, "-" for standard input.
  std::string file;
  /// The plug-in's bundle; none for that of the program.
  std::optional<std::string> bundle;
  /// The device description; none for that of this machine.
  std::optional<std::string> device;
  bool reportsJSON = false;
};

/// Says what a migration would not carry over from an account settings file or a legacy store as it
/// stands. The exit status of the report is ExitStatus::Attention when there is something. Other
/// kinds of files are an error.
CommandResult check(const CheckOptions& options, const Terminal& terminal,
                    const CommandWorker& worker);

}  // namespace accounts
