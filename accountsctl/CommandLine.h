#pragma once

#include <optional>
#include <string>
#include <variant>

#include "accountsctl/CheckCommand.h"
#include "accountsctl/ConvertCommand.h"
#include "accountsctl/DiffCommand.h"
#include "accountsctl/ExplainCommand.h"
#include "accountsctl/FrameworkCheck.h"
#include "accountsctl/ShowCommand.h"
#include "accountsctl/StatusCommand.h"
#include "accountsctl/SummarizeCommand.h"
#include "commandline/ArgumentParsing.h"

namespace accounts {

inline constexpr const char* kProgramName = "accountsctl";

/// What the arguments ask for.
struct CommandLine {
  std::variant<ShowOptions, DiffOptions, CheckOptions, StatusOptions, ConvertOptions,
               SummarizeOptions, ExplainOptions, FrameworkCheckOptions, RequestedText,
               UnusableArguments>
      asked;
  /// The subcommand's name; none when the arguments name none.
  std::optional<std::string> subcommand;
  /// The root that is named; none when none is, whatever else is wrong.
  std::optional<std::string> root;
  /// Whether the report is to be a JSON object, that of an error too.
  bool wantsJSON = false;
};

/// What the arguments of the program ask for. Touches no file.
CommandLine parseCommandLine(int argumentCount, const char* const* arguments);

}  // namespace accounts
