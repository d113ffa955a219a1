#pragma once

#include <optional>
#include <string>
#include <variant>

#include "commandline/ArgumentParsing.h"
#include "host/ReportFiles.h"
#include "host/RestoreCommand.h"
#include "host/RunCommand.h"

namespace accounts {

inline constexpr const char* kProgramName = "migration-host";

/// What the arguments ask for.
struct CommandLine {
  std::variant<RunOptions, RestoreOptions, RequestedText, UnusableArguments> asked;
  /// Whether the report is to be a JSON object, that of an error too.
  bool wantsJSON = false;
  /// The device root, also where the arguments cannot be used; none when they do not say.
  std::optional<std::string> root;
  /// Where the report of a run or a plan goes besides.
  ReportFiles reports;
};

/// What the arguments of the program ask for. Touches no file.
CommandLine parseCommandLine(int argumentCount, const char* const* arguments);

}  // namespace accounts
