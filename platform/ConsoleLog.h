#pragma once

#include <string_view>

namespace accounts {

/// The process's standard diagnostic output.
class ConsoleLog {
 public:
  virtual ~ConsoleLog() = default;

  /// Writes one line, given without its line end, verbatim.
  virtual void writeLine(std::string_view line) = 0;
};

}  // namespace accounts
