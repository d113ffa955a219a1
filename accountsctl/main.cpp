#include <cstdlib>
#include <new>
#include <string>
#include <variant>

#include "accountsctl/CommandLine.h"
#include "accountsctl/JSONText.h"
#include "commandline/MemoryReserve.h"
#include "commandline/StandardStreams.h"
#include "commandline/Terminal.h"

namespace accounts {
namespace {

CommandResult runCommand(const ShowOptions& options) {
  return show(options, standardOutputTerminal(::getenv));
}
CommandResult runCommand(const DiffOptions& options) {
  return diff(options, standardOutputTerminal(::getenv));
}
CommandResult runCommand(const CheckOptions& options) {
  return check(options, standardOutputTerminal(::getenv));
}
CommandResult runCommand(const StatusOptions& options) {
  return status(options, standardOutputTerminal(::getenv));
}
CommandResult runCommand(const ConvertOptions& options) {
  return convert(options);
}
CommandResult runCommand(const SummarizeOptions& options) {
  return summarize(options, standardOutputTerminal(::getenv));
}
CommandResult runCommand(const ExplainOptions& options) {
  return explain(options);
}
CommandResult runCommand(const RequestedText& requested) {
  return CommandReport{requested.text};
}
CommandResult runCommand(const UnusableArguments& unusable) {
  return ProgramError{ExitStatus::UnusableArguments, unusable.message};
}

/// An error as the object that a program reads in the place of the report.
std::string errorObject(const CommandLine& commandLine, const ProgramError& error) {
  JSON object = reportObject("");
  object["command"] = commandLine.subcommand ? JSON(*commandLine.subcommand) : JSON(nullptr);
  if (commandLine.root) {
    object["root"] = *commandLine.root;
  }
  object["error"] = error.message;
  return lineOf(std::move(object), error.exitStatus);
}

/// What a command came to; want of memory is an error like another.
CommandResult resultOf(const CommandLine& commandLine) {
  try {
    return std::visit([](const auto& asked) { return runCommand(asked); }, commandLine.asked);
  } catch (const std::bad_alloc&) {
    return outOfMemory();
  }
}

ExitStatus run(const CommandLine& commandLine) {
  const CommandResult result = resultOf(commandLine);
  if (const auto* error = std::get_if<ProgramError>(&result)) {
    printError(kProgramName, error->message);
    return commandLine.wantsJSON ? printResult(kProgramName, errorObject(commandLine, *error),
                                               error->exitStatus, ReaderThatLeft::HasSeenEnough)
                                 : error->exitStatus;
  }
  const auto& report = std::get<CommandReport>(result);
  return printResult(kProgramName, report.text, report.exitStatus, ReaderThatLeft::HasSeenEnough);
}

}  // namespace
}  // namespace accounts

int main(int argumentCount, char** arguments) {
  accounts::prepareStandardStreams();
  accounts::endWhereMemoryIsWanted(accounts::kProgramName);
  try {
    return static_cast<int>(accounts::run(accounts::parseCommandLine(argumentCount, arguments)));
  } catch (const std::bad_alloc&) {
    accounts::printError(accounts::kProgramName, accounts::outOfMemory().message);
    return static_cast<int>(accounts::outOfMemory().exitStatus);
  }
}
