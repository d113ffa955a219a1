#include "commandline/UsageProblem.h"

#include <CLI/CLI.hpp>
#include <algorithm>
#include <string_view>
#include <vector>

#include "commandline/Suggestion.h"

namespace accounts {
namespace {

/// How the reasons of this program's own checks begin.
constexpr std::string_view kOwnReason = "must ";

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

/// Whether an option of a subcommand stands before it.
bool isMisplaced(const std::string& word, const std::vector<std::string>& names) {
  return std::find(names.begin(), names.end(), word) != names.end();
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
    const std::string name = option->substr(0, option->find('='));
    const std::vector<std::string> known = optionNames(part);
    return isMisplaced(name, known) ? name + " has to stand behind " + part.get_name()
                                    : unknown("option", name, known);
  }
  return "Unexpected argument: " + untaken.front();
}

/// An option as the help names it, with what stands for its value.
std::string withValue(const CLI::Option& option) {
  const std::string& value = option.get_option_text();
  return option.get_name() + (value.empty() || value == " " ? "" : " " + value);
}

bool isGivenTooOften(const CLI::Option& option) {
  return option.count() > 1 && option.get_items_expected_max() == 1;
}

std::optional<std::string> problemOfOption(const CLI::Option& option) {
  if (option.get_required() && option.count() == 0) {
    return withValue(option) + " is needed";
  }
  if (isGivenTooOften(option)) {
    return option.get_name() + " is given more than once";
  }
  if (option.count() == 0) {
    return std::nullopt;
  }
  for (const CLI::Option* other : option.get_excludes()) {
    if (other->count() > 0) {
      return option.get_name() + " and " + other->get_name() + " cannot be given together";
    }
  }
  for (const CLI::Option* other : option.get_needs()) {
    if (other->count() == 0) {
      return option.get_name() + " needs " + withValue(*other);
    }
  }
  return std::nullopt;
}

/// What is wrong with the value of the option that an error begins with.
std::optional<std::string> problemOfValue(const CLI::App& part, std::string_view error) {
  const std::size_t colon = error.find(": ");
  const CLI::Option* const option =
      colon != std::string::npos ? part.get_option_no_throw(std::string(error.substr(0, colon)))
                                 : nullptr;
  if (option == nullptr || isGivenTooOften(*option)) {
    return std::nullopt;
  }
  const std::string_view reason = error.substr(colon + 2);
  if (reason.starts_with(kOwnReason)) {
    return std::string(error);
  }
  return option->count() == 0
             ? "The " + option->get_option_text() + " of " + option->get_name() + " is missing"
             : option->get_name() + " cannot be " + option->results().back();
}

}  // namespace

std::optional<std::string> missingSubcommand(const CLI::App& program) {
  if (!program.get_subcommands().empty() || subcommandNames(program).empty()) {
    return std::nullopt;
  }
  std::string message = "A subcommand is required:";
  for (const std::string& name : subcommandNames(program)) {
    message += (message.ends_with(':') ? " " : ", ") + name;
  }
  return message;
}

std::string usageProblem(const CLI::App& program, const CLI::Error& error) {
  // A word that is misspelt is what is wrong, rather than the one that it leaves missing.
  if (const std::optional<std::string> problem = problemOfUntakenWords(program)) {
    return *problem;
  }
  const CLI::App& part = chosenPart(program);
  if (const std::optional<std::string> problem = problemOfValue(part, error.what())) {
    return *problem;
  }
  for (const CLI::Option* option : part.get_options()) {
    if (const std::optional<std::string> problem = problemOfOption(*option)) {
      return *problem;
    }
  }
  return "The arguments cannot be used";
}

}  // namespace accounts
