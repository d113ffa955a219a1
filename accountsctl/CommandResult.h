#pragma once

#include <string>
#include <variant>

#include "commandline/ExitStatus.h"

namespace accounts {

/// What a subcommand that did its work has to say.
struct CommandReport {
  /// For standard output.
  std::string text;
  ExitStatus exitStatus = ExitStatus::Success;
};

using CommandResult = std::variant<CommandReport, ProgramError>;

}  // namespace accounts
