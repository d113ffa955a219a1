#include <fcntl.h>
#include <unistd.h>

#include <csignal>
#include <iostream>
#include <string>
#include <variant>

#include "host/CommandLine.h"
#include "host/RestoreCommand.h"
#include "host/RunCommand.h"
#include "host/RunReport.h"
#include "propertylist/Description.h"

namespace accounts {
namespace {

/// Makes sure that the three standard streams are open, so that no file of the migration can take
/// the number of one of them.
void openStandardStreams() {
  for (const int stream : {STDIN_FILENO, STDOUT_FILENO, STDERR_FILENO}) {
    if (fcntl(stream, F_GETFD) < 0) {
      // Gives the lowest free number, which is the stream's own.
      [[maybe_unused]] const int opened = open("/dev/null", O_RDWR);
    }
  }
}

void printLine(const std::string& beginning, const std::string& message) {
  std::string line = beginning;
  appendEscapedText(line, message);
  std::cerr << line + "\n";
}

void printError(const std::string& message) {
  printLine("migration-host: ", message);
}

/// Writes the program's whole result to standard output, and tells when it does not arrive.
/// `exitStatus` is how the program ends when it does.
ExitStatus print(const std::string& text, ExitStatus exitStatus) {
  std::cout << text << std::flush;
  if (std::cout.good()) {
    return exitStatus;
  }
  printError("The result cannot be written to standard output");
  return ExitStatus::InputOutputError;
}

ExitStatus finish(const RunReport& report, OutputForm output) {
  for (const std::string& warning : report.warnings) {
    printLine("migration-host: warning: ", warning);
  }
  if (report.error) {
    printError(*report.error);
  }
  return print(output == OutputForm::JSON ? jsonText(report) + "\n" : summaryText(report),
               report.exitStatus);
}

ExitStatus finish(const RequestedText& requested) {
  return print(requested.text, ExitStatus::Success);
}

ExitStatus finish(const UsageError& error) {
  RunReport report;
  setError(report, HostError{ExitStatus::UnusableArguments, error.message});
  return finish(report, error.output);
}

ExitStatus finish(const RunOptions& options) {
  return finish(runMigration(options), options.output);
}

ExitStatus finish(const RestoreOptions& options) {
  const Restoration restoration = runRestoration(options);
  if (restoration.error) {
    printError(restoration.error->message);
  }
  return print(options.output == OutputForm::JSON ? jsonText(restoration, options.root) + "\n"
                                                  : summaryText(restoration),
               exitStatusOf(restoration));
}

}  // namespace
}  // namespace accounts

int main(int argumentCount, char** arguments) {
  accounts::openStandardStreams();
  // A reader of the log that goes away must not end a migration halfway.
  signal(SIGPIPE, SIG_IGN);
  const accounts::CommandLine commandLine = accounts::parseCommandLine(argumentCount, arguments);
  return static_cast<int>(
      std::visit([](const auto& asked) { return accounts::finish(asked); }, commandLine));
}
