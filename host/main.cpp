#include <cstdlib>
#include <string>
#include <variant>

#include "commandline/StandardStreams.h"
#include "commandline/Terminal.h"
#include "host/CommandLine.h"
#include "host/RunReport.h"
#include "report/ReportText.h"

namespace accounts {
namespace {

void printProblems(const RunReport& report) {
  for (const std::string& warning : report.warnings) {
    printWarning(kProgramName, warning);
  }
  if (report.error) {
    printError(kProgramName, *report.error);
  }
}

ExitStatus finish(const RunReport& report, bool wantsJSON) {
  printProblems(report);
  return printResult(kProgramName, wantsJSON ? jsonText(report) + "\n" : summaryText(report),
                     report.exitStatus);
}

/// A run or a plan that is not made for want of the report that was asked for.
ExitStatus finish(const ProgramError& error, const std::string& root, bool wantsJSON) {
  RunReport report;
  report.root = root;
  setError(report, error);
  return finish(report, wantsJSON);
}

/// Writes the reports that are wanted. A report that is missing is an error of a program that
/// otherwise succeeded.
void finishReports(const CommandLine& commandLine, HostOutcome& outcome, const JSON& report) {
  const std::optional<ProgramError> error = writeReport(commandLine.reports, report);
  if (!error) {
    return;
  }
  if (outcome.report.error) {
    outcome.report.warnings.push_back(error->message);
  } else {
    setError(outcome.report, *error);
  }
}

ExitStatus finish(const RunOptions& options, const CommandLine& commandLine) {
  if (const auto error = whyNotWritable(commandLine.reports)) {
    return finish(*error, options.device.root, commandLine.wantsJSON);
  }
  HostOutcome outcome = runMigration(options);
  if (commandLine.reports.areWanted()) {
    finishReports(commandLine, outcome, fullReport("run", outcome));
  }
  return finish(outcome.report, commandLine.wantsJSON);
}

ExitStatus finish(const PlanOptions& options, const CommandLine& commandLine) {
  if (const auto error = whyNotWritable(commandLine.reports)) {
    return finish(*error, options.device.root, commandLine.wantsJSON);
  }
  HostOutcome outcome = planMigration(options);
  const JSON report = fullReport("plan", outcome);
  finishReports(commandLine, outcome, report);
  printProblems(outcome.report);
  return printResult(kProgramName,
                     commandLine.wantsJSON ? lineOf(report) + "\n"
                                           : reportText(report, standardOutputTerminal(::getenv)),
                     outcome.report.exitStatus);
}

ExitStatus finish(const RestoreOptions& options, const CommandLine& commandLine) {
  const Restoration restoration = runRestoration(options);
  if (restoration.error) {
    printError(kProgramName, restoration.error->message);
  }
  return printResult(
      kProgramName,
      commandLine.wantsJSON ? jsonText(restoration, options.root) + "\n" : summaryText(restoration),
      exitStatusOf(restoration));
}

ExitStatus finish(const RequestedText& requested, const CommandLine& /*commandLine*/) {
  return printResult(kProgramName, requested.text, ExitStatus::Success);
}

ExitStatus finish(const UnusableArguments& unusable, const CommandLine& commandLine) {
  RunReport report;
  setError(report, ProgramError{ExitStatus::UnusableArguments, unusable.message});
  return finish(report, commandLine.wantsJSON);
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
