#include "commandline/ArgumentParsing.h"

#include <CLI/CLI.hpp>
#include <algorithm>
#include <optional>
#include <string_view>
#include <vector>

#include "commandline/Suggestion.h"

namespace accounts {
namespace {

/// The part of the program that the arguments chose: a subcommand or the program itself.
const CLI::App& chosenPart(const CLI::App& program) {
  const std::vector<CLI::App*> chosen = program.get_subcommands();
  return chosen.empty() ? program : *chosen.front();
}

std::vector<std::string> subcommandNames(const CLI::App& program) {
  std::vector<std::string> names;
  for (const CLI::App* subcommand : program.get_subcommands([](const CLI::App*) { return true; })) {
    names.push_back(subcommand->get_name());
  }
  return names;
}

std::vector<std::string> optionNames(const CLI::App& part) {
  std::vector<std::string> names;
  for (const CLI::Option* option : part.get_options()) {
    for (const std::string& name : option->get_lnames()) {
      names.push_back("--" + name);
    }
  }
  return names;
}

std::string unknown(std::string_view what, const std::string& word,
                    const std::vector<std::string>& candidates) {
  std::string message = "Unknown ";
  message.append(what).append(": ").append(word);
  if (const std::optional<std::string> suggestion = suggestionFor(word, candidates)) {
    message += "; did you mean '" + *suggestion + "'?";
  }
  return message;
}

/// What is wrong with the first word that nothing in the program takes; none when all were taken.
std::optional<std::string> problemOfUntakenWords(const CLI::App& program) {
  std::vector<std::string> untaken = program.remaining(/*recurse=*/true);
  // The end of the options is nobody's, and never what is wrong.
  std::erase(untaken, "--");
  if (untaken.empty()) {
    return std::nullopt;
  }
  const CLI::App& part = chosenPart(program);
  const std::vector<std::string> subcommands = subcommandNames(part);
  // Options belong to a subcommand that is not known yet.
  if (!subcommands.empty() && !untaken.front().starts_with('-')) {
    return unknown("subcommand", untaken.front(), subcommands);
  }
  const auto option = std::find_if(untaken.begin(), untaken.end(),
                                   [](const std::string& word) { return word.starts_with('-'); });
  if (option != untaken.end()) {
    return unknown("option", option->substr(0, option->find('=')), optionNames(part));
  }
  return "Unexpected argument: " + untaken.front();
}

std::string missingSubcommand(const CLI::App& program) {
  std::string message = "A subcommand is required:";
  for (const std::string& name : subcommandNames(program)) {
    message += (message.ends_with(':') ? " " : ", ") + name;
  }
  return message;
}

}  // namespace

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
    // A word that is misspelt is what is wrong, rather than the one that it leaves missing.
    return unusableArguments(problemOfUntakenWords(program).value_or(error.what()));
  }
  if (program.get_subcommands().empty() && !subcommandNames(program).empty()) {
    return unusableArguments(missingSubcommand(program));
  }
  return ParsedArguments{};
}

bool hasArgument(int argumentCount, const char* const* arguments, std::string_view word) {
  return std::any_of(arguments, arguments + argumentCount,
                     [&](std::string_view argument) { return argument == word; });
}

}  // namespace accounts
