#pragma once

#include <optional>
#include <string>

#include "commandline/ExitStatus.h"

namespace accounts {

/// What a subcommand that did its work has to say.
struct CommandReport {
  /// For standard output.
  std::string text;
  ExitStatus exitStatus = ExitStatus::Success;
  /// What the file gets that the arguments name for it; the text is for when it is written.
  std::optional<std::string> file = {};
};

using CommandResult = OrProgramError<CommandReport>;

}  // namespace accounts
