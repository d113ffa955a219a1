#include <string>
#include <variant>

#include "commandline/StandardStreams.h"
#include "host/CommandLine.h"
#include "host/RunReport.h"

namespace accounts {
namespace {

ExitStatus finish(const RunReport& report, bool wantsJSON) {
  for (const std::string& warning : report.warnings) {
    printWarning(kProgramName, warning);
  }
  if (report.error) {
    printError(kProgramName, *report.error);
  }
  return printResult(kProgramName, wantsJSON ? jsonText(report) + "\n" : summaryText(report),
                     report.exitStatus);
}

ExitStatus finish(const RunOptions& options, bool wantsJSON) {
  return finish(runMigration(options), wantsJSON);
}

ExitStatus finish(const RestoreOptions& options, bool wantsJSON) {
  const Restoration restoration = runRestoration(options);
  if (restoration.error) {
    printError(kProgramName, restoration.error->message);
  }
  return printResult(
      kProgramName,
      wantsJSON ? jsonText(restoration, options.root) + "\n" : summaryText(restoration),
      exitStatusOf(restoration));
}

ExitStatus finish(const RequestedText& requested, bool /*wantsJSON*/) {
  return printResult(kProgramName, requested.text, ExitStatus::Success);
}

ExitStatus finish(const UnusableArguments& unusable, bool wantsJSON) {
  RunReport report;
  setError(report, ProgramError{ExitStatus::UnusableArguments, unusable.message});
  return finish(report, wantsJSON);
}

}  // namespace
}  // namespace accounts

int main(int argumentCount, char** arguments) {
  // A reader of the log that goes away must not end a migration halfway.
  accounts::prepareStandardStreams();
  const accounts::CommandLine commandLine = accounts::parseCommandLine(argumentCount, arguments);
  return static_cast<int>(
      std::visit([&](const auto& asked) { return accounts::finish(asked, commandLine.wantsJSON); },
                 commandLine.asked));
}
