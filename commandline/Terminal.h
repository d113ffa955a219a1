#pragma once

#include <cstddef>
#include <functional>
#include <string>
#include <string_view>

namespace accounts {

/// Gives the value of a variable of the environment, null for none.
using EnvironmentLookup = std::function<const char*(const char* variable)>;

/// How a person sees what the program writes.
struct Terminal {
  /// Characters in a line.
  std::size_t width = 80;
  /// Whether it is a terminal that a person looks at, rather than a file or a pipe.
  bool isInteractive = true;
  /// Whether colours and heavy letters are understood and wanted.
  bool isColoured = false;
};

/// How standard output is seen. The width is COLUMNS if that is a number above 0, else the
/// terminal's own, else 80. Only a terminal that is not dumb has colours, and none if NO_COLOR is
/// set and not empty.
Terminal standardOutputTerminal(const EnvironmentLookup& environment);

/// Kinds of words that stand out.
enum class Emphasis { Heading, Warning, Added, Removed };

/// A text that stands out where the terminal has colours, and the text alone elsewhere.
std::string emphasized(const Terminal& terminal, Emphasis emphasis, std::string_view text);

}  // namespace accounts
