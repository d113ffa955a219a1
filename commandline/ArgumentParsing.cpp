#include "commandline/ArgumentParsing.h"

#include <CLI/CLI.hpp>
#include <algorithm>
#include <optional>

#include "commandline/UsageProblem.h"

namespace accounts {

UnusableArguments unusableArguments(const std::string& reason) {
  return UnusableArguments{reason + " (--help explains)"};
}

ArgumentParsing parseArguments(CLI::App& program, int argumentCount, const char* const* arguments) {
  program.require_subcommand(0, 1);
  try {
    program.parse(argumentCount, arguments);
  } catch (const CLI::CallForHelp&) {
    return RequestedText{program.help()};
  } catch (const CLI::CallForVersion& request) {
    return RequestedText{std::string(request.what()) + "\n"};
  } catch (const CLI::Error& error) {
    return unusableArguments(usageProblem(program, error));
  }
  if (const std::optional<std::string> problem = missingSubcommand(program)) {
    return unusableArguments(*problem);
  }
  return ParsedArguments{};
}

bool hasArgument(int argumentCount, const char* const* arguments, std::string_view word) {
  return std::any_of(arguments, arguments + argumentCount,
                     [&](std::string_view argument) { return argument == word; });
}

std::optional<std::string> valueOfOption(int argumentCount, const char* const* arguments,
                                         const std::string& name) {
  for (int index = 1; index < argumentCount; ++index) {
    const std::string word = arguments[index];
    if (word == name && index + 1 < argumentCount) {
      return arguments[index + 1];
    }
    if (word.starts_with(name + "=")) {
      return word.substr(name.size() + 1);
    }
  }
  return std::nullopt;
}

}  // namespace accounts
