#include <cstdlib>
#include <new>
#include <string>
#include <variant>

#include "commandline/MemoryReserve.h"
#include "commandline/StackLimit.h"
#include "commandline/StandardStreams.h"
#include "commandline/Terminal.h"
#include "host/CommandLine.h"
#include "host/RestoreCommand.h"
#include "host/RunCommand.h"
#include "host/RunReport.h"

namespace accounts {
namespace {

ExitStatus finish(const RunOptions& options, const CommandLine& commandLine) {
  RunOptions complete = options;
  complete.wantsJSON = commandLine.wantsJSON;
  complete.reports = commandLine.reports;
  complete.terminal = standardOutputTerminal(::getenv);
  return runMigration(complete);
}

ExitStatus finish(const RestoreOptions& options, const CommandLine& commandLine) {
  const RestoreResult result = runRestoration(options);
  if (result.restoration.error) {
    printError(kProgramName, result.restoration.error->message);
  }
  return printResult(
      kProgramName,
      commandLine.wantsJSON ? jsonText(result, options) + "\n" : summaryText(result, options),
      exitStatusOf(result));
}

ExitStatus finish(const RequestedText& requested, const CommandLine& /*commandLine*/) {
  return printResult(kProgramName, requested.text, ExitStatus::Success);
}

/// Tells of an error that kept everything from being done.
ExitStatus finish(const ProgramError& error, const CommandLine& commandLine) {
  RunReport report;
  report.root = commandLine.root;
  setError(report, error);
  printError(kProgramName, error.message);
  return printResult(kProgramName, commandLine.wantsJSON ? jsonText(report) + "\n" : "",
                     report.exitStatus);
}

ExitStatus finish(const UnusableArguments& unusable, const CommandLine& commandLine) {
  return finish(ProgramError{ExitStatus::UnusableArguments, unusable.message}, commandLine);
}

ExitStatus run(int argumentCount, char** arguments) {
  CommandLine commandLine;
  try {
    const MemoryReserve reserve;
    commandLine = parseCommandLine(argumentCount, arguments);
    if (const auto stack = askForStack(); !stack) {
      return finish(stack.error(), commandLine);
    }
    return std::visit([&](const auto& asked) { return finish(asked, commandLine); },
                      commandLine.asked);
  } catch (const std::bad_alloc&) {
    // What was begun is taken apart, and the memory free.
    return finish(outOfMemory(), commandLine);
  }
}

}  // namespace
}  // namespace accounts

int main(int argumentCount, char** arguments) {
  // A reader of the log that goes away must not end a migration halfway.
  accounts::prepareStandardStreams();
  accounts::endWhereMemoryIsWanted(accounts::kProgramName);
  return static_cast<int>(accounts::run(argumentCount, arguments));
}
