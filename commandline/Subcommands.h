#pragma once

#include <CLI/App.hpp>
#include <optional>
#include <span>
#include <string>
#include <variant>

#include "commandline/ArgumentParsing.h"

namespace accounts {

/// What the help says of a program, apart from its subcommands.
struct ProgramTexts {
  const char* name;
  /// What --version prints.
  const char* version;
  const char* description;
  const char* examples;
  /// The exit statuses for errors that all subcommands have.
  const char* errors;
};

/// What the help says of a subcommand, apart from its options.
struct SubcommandTexts {
  const char* name;
  const char* description;
  const char* exitStatuses;
  /// The exit statuses for errors that it has beside those of all; may be empty.
  const char* errors;
  const char* examples;
};

/// A subcommand of a program whose subcommands together take Arguments and ask for an Asked: how
/// its arguments are declared, and what they ask for once they are parsed.
template <class Arguments, class Asked>
struct Subcommand {
  SubcommandTexts texts;
  void (*add)(CLI::App& command, Arguments& arguments);
  Asked (*asked)(Arguments& arguments);
};

/// What a program is asked for.
template <class Asked>
struct AskedOfProgram {
  /// What the chosen subcommand is asked for, a RequestedText, or UnusableArguments.
  Asked asked;
  /// The chosen subcommand's name; none when the arguments name none.
  std::optional<std::string> subcommand;
};

/// Declares a program's help and version.
void describeProgram(CLI::App& program, const ProgramTexts& texts);
/// Declares a subcommand with its help, without its arguments.
CLI::App& addSubcommand(CLI::App& program, const ProgramTexts& programTexts,
                        const SubcommandTexts& texts);

/// Parses the arguments of a program with subcommands. `arguments` is filled by what they declare
/// and must outlive the call.
template <class Arguments, class Asked>
AskedOfProgram<Asked> parseSubcommands(const ProgramTexts& texts,
                                       std::span<const Subcommand<Arguments, Asked>> subcommands,
                                       int argumentCount, const char* const* words,
                                       Arguments& arguments) {
  CLI::App program;
  describeProgram(program, texts);
  for (const Subcommand<Arguments, Asked>& subcommand : subcommands) {
    subcommand.add(addSubcommand(program, texts, subcommand.texts), arguments);
  }
  ArgumentParsing parsing = parseArguments(program, argumentCount, words);
  AskedOfProgram<Asked> result;
  for (const Subcommand<Arguments, Asked>& subcommand : subcommands) {
    if (program.got_subcommand(subcommand.texts.name)) {
      result.subcommand = subcommand.texts.name;
      if (std::holds_alternative<ParsedArguments>(parsing)) {
        result.asked = subcommand.asked(arguments);
      }
    }
  }
  if (auto* text = std::get_if<RequestedText>(&parsing)) {
    result.asked = std::move(*text);
  } else if (auto* problem = std::get_if<UnusableArguments>(&parsing)) {
    result.asked = std::move(*problem);
  }
  return result;
}

}  // namespace accounts
