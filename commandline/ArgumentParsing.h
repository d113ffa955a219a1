#pragma once

#include <CLI/App.hpp>
#include <optional>
#include <string>
#include <variant>

namespace accounts {

/// The arguments were parsed and stand where the program's options put them.
struct ParsedArguments {};

/// The person asked for a text (help, the version) and for nothing else.
struct RequestedText {
  std::string text;
};

/// The arguments cannot be used.
struct UnusableArguments {
  /// One line that says which argument is wrong, and what may have been meant.
  std::string message;
};

/// Arguments that cannot be used for the reason given, with a word on where help is.
UnusableArguments unusableArguments(const std::string& reason);

using ArgumentParsing = std::variant<ParsedArguments, RequestedText, UnusableArguments>;

/// Parses a program's arguments, the program's name included. A program that has subcommands needs
/// one of them. A subcommand or an option that is unknown is named, with the one that is spelt most
/// alike, whatever else is wrong.
ArgumentParsing parseArguments(CLI::App& program, int argumentCount, const char* const* arguments);

/// Whether a word stands among the arguments, also when the arguments as a whole cannot be used.
bool hasArgument(int argumentCount, const char* const* arguments, std::string_view word);

/// The value that an option is given, in either way of writing it, also when the arguments as a
/// whole cannot be used; none when it is given none.
std::optional<std::string> valueOfOption(int argumentCount, const char* const* arguments,
                                         const std::string& name);

}  // namespace accounts
