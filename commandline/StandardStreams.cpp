#include "commandline/StandardStreams.h"

#include <fcntl.h>
#include <unistd.h>

#include <cerrno>
#include <csignal>
#include <iostream>

#include "platform/linux/FileContents.h"
#include "propertylist/value/Description.h"

namespace accounts {
namespace {

void printLine(std::string_view program, std::string_view separator, std::string_view message) {
  std::string line(program);
  line += separator;
  appendEscapedText(line, message);
  std::cerr << line + "\n";
}

}  // namespace

void prepareStandardStreams() {
  for (const int stream : {STDIN_FILENO, STDOUT_FILENO, STDERR_FILENO}) {
    if (fcntl(stream, F_GETFD) < 0) {
      // Gives the lowest free number, which is the stream's own. For one direction alone: a result
      // that is written to a closed standard output did not arrive.
      [[maybe_unused]] const int opened =
          open("/dev/null", stream == STDIN_FILENO ? O_WRONLY : O_RDONLY);
    }
  }
  signal(SIGPIPE, SIG_IGN);
}

void printError(std::string_view program, std::string_view message) {
  printLine(program, ": ", message);
}

void printWarning(std::string_view program, std::string_view message) {
  printLine(program, ": warning: ", message);
}

ExitStatus printResult(std::string_view program, const std::string& text, ExitStatus exitStatus,
                       ReaderThatLeft reader) {
  const int number = writeAll(STDOUT_FILENO, text);
  if (number == 0 || (number == EPIPE && reader == ReaderThatLeft::HasSeenEnough)) {
    return exitStatus;
  }
  printError(program, "The result cannot be written to standard output");
  return ExitStatus::InputOutputError;
}

}  // namespace accounts
