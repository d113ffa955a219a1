#include <cstdlib>
#include <string>
#include <variant>

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

ExitStatus finish(const UnusableArguments& unusable, const CommandLine& commandLine) {
  RunReport report;
  report.root = commandLine.root;
  setError(report, ProgramError{ExitStatus::UnusableArguments, unusable.message});
  printError(kProgramName, unusable.message);
  return printResult(kProgramName, commandLine.wantsJSON ? jsonText(report) + "\n" : "",
                     report.exitStatus);
}

}  // namespace
}  // namespace accounts

int main(int argumentCount, char** arguments) {
  // A reader of the log that goes away must not end a migration halfway.
  accounts::prepareStandardStreams();
  const accounts::CommandLine commandLine = accounts::parseCommandLine(argumentCount, arguments);
  return static_cast<int>(std::visit(
      [&](const auto& asked) { return accounts::finish(asked, commandLine); }, commandLine.asked));
}
