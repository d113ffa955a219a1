#include <cstdlib>
#include <new>
#include <string>
#include <variant>

#include "accountsctl/CommandLine.h"
#include "accountsctl/CommandWorker.h"
#include "accountsctl/JSONText.h"
#include "commandline/MemoryReserve.h"
#include "commandline/ReplacedFile.h"
#include "commandline/StackLimit.h"
#include "commandline/StandardStreams.h"
#include "commandline/Terminal.h"

namespace accounts {
namespace {

template <class Options>
using TerminalCommand = CommandResult (*)(const Options&, const Terminal&, const CommandWorker&);

template <class Options>
CommandResult runForTerminal(TerminalCommand<Options> command, const Options& options,
                             std::string_view who = kCommand) {
  return runInWorker(
      [&, terminal = standardOutputTerminal(::getenv)](const CommandWorker& worker) {
        return command(options, terminal, worker);
      },
      {}, who);
}

CommandResult runCommand(const ShowOptions& options) {
  return runForTerminal(show, options);
}
CommandResult runCommand(const DiffOptions& options) {
  return runForTerminal(diff, options);
}
CommandResult runCommand(const CheckOptions& options) {
  return runForTerminal(check, options);
}
CommandResult runCommand(const FrameworkCheckOptions& options) {
  return runForTerminal(checkFramework, options, "The framework");
}
CommandResult runCommand(const StatusOptions& options) {
  return runForTerminal(status, options);
}
CommandResult runCommand(const ConvertOptions& options) {
  return runInWorker([&](const CommandWorker& worker) { return convert(options, worker); });
}
CommandResult runCommand(const ExplainOptions& options) {
  return runInWorker([&](const CommandWorker& worker) { return explain(options, worker); });
}
CommandResult runCommand(const SummarizeOptions& options) {
  const std::vector<SummarizedFile> files = filesToSummarize(options);
  const Terminal terminal = standardOutputTerminal(::getenv);
  return runInWorker(
      [&](const CommandWorker& worker) { return summarize(options, files, terminal, worker); },
      [&](const TakePiece& take) { return readAloud(files, take); });
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

/// The file that the arguments name for what a command makes; null for none.
const std::string* outputFileOf(const CommandLine& commandLine) {
  if (const auto* const convert = std::get_if<ConvertOptions>(&commandLine.asked)) {
    return &convert->output;
  }
  const auto* const summarize = std::get_if<SummarizeOptions>(&commandLine.asked);
  return summarize != nullptr && summarize->html ? &*summarize->html : nullptr;
}

/// What a command came to, its file written; want of memory is an error like another.
CommandResult resultOf(const CommandLine& commandLine) {
  try {
    if (const auto stack = askForStack(); !stack) {
      return stack.error();
    }
    CommandResult result =
        std::visit([](const auto& asked) { return runCommand(asked); }, commandLine.asked);
    const std::string* const output = outputFileOf(commandLine);
    if (!result || !result->file || output == nullptr) {
      return result;
    }
    const auto replaced = replaceFile(*output, *result->file);
    return replaced ? result : replaced.error();
  } catch (const std::bad_alloc&) {
    return outOfMemory();
  }
}

ExitStatus run(const CommandLine& commandLine) {
  const CommandResult result = resultOf(commandLine);
  if (!result) {
    printError(kProgramName, result.error().message);
    return commandLine.wantsJSON
               ? printResult(kProgramName, errorObject(commandLine, result.error()),
                             result.error().exitStatus, ReaderThatLeft::HasSeenEnough)
               : result.error().exitStatus;
  }
  return printResult(kProgramName, result->text, result->exitStatus, ReaderThatLeft::HasSeenEnough);
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
