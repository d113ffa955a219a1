#include "commandline/Terminal.h"

#include <sys/ioctl.h>
#include <unistd.h>

#include <charconv>
#include <optional>

namespace accounts {
namespace {

std::string_view valueOf(const EnvironmentLookup& environment, const char* variable) {
  const char* value = environment(variable);
  return value != nullptr ? value : std::string_view();
}

std::optional<std::size_t> columnsIn(std::string_view text) {
  std::size_t columns = 0;
  const char* const end = text.data() + text.size();
  const auto result = std::from_chars(text.data(), end, columns);
  return result.ec == std::errc() && result.ptr == end && columns > 0 ? std::optional(columns)
                                                                      : std::nullopt;
}

std::optional<std::size_t> widthOfStandardOutput() {
  winsize size = {};
  return ioctl(STDOUT_FILENO, TIOCGWINSZ, &size) == 0 && size.ws_col > 0
             ? std::optional<std::size_t>(size.ws_col)
             : std::nullopt;
}

std::string_view codeOf(Emphasis emphasis) {
  switch (emphasis) {
    case Emphasis::Heading:
      return "1";
    case Emphasis::Warning:
      return "33";
    case Emphasis::Added:
      return "32";
    case Emphasis::Removed:
      return "31";
  }
  return "";
}

}  // namespace

Terminal standardOutputTerminal(const EnvironmentLookup& environment) {
  Terminal terminal;
  const std::optional<std::size_t> columns = columnsIn(valueOf(environment, "COLUMNS"));
  terminal.width = columns ? *columns : widthOfStandardOutput().value_or(terminal.width);
  terminal.isInteractive = isatty(STDOUT_FILENO) == 1;
  terminal.isColoured = terminal.isInteractive && valueOf(environment, "NO_COLOR").empty() &&
                        valueOf(environment, "TERM") != "dumb";
  return terminal;
}

std::string emphasized(const Terminal& terminal, Emphasis emphasis, std::string_view text) {
  if (!terminal.isColoured || text.empty()) {
    return std::string(text);
  }
  std::string coloured = "\033[";
  return coloured.append(codeOf(emphasis)).append("m").append(text).append("\033[0m");
}

}  // namespace accounts
