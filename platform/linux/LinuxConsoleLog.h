#pragma once

#include <unistd.h>

#include <string_view>

#include "platform/ConsoleLog.h"

namespace accounts {

/// Standard error. Each line is one write, so that lines of several processes do not mix.
class LinuxConsoleLog final : public ConsoleLog {
 public:
  /// `descriptor` stays the caller's and must stay open.
  explicit LinuxConsoleLog(int descriptor = STDERR_FILENO) : descriptor_(descriptor) {}

  void writeLine(std::string_view line) override;

 private:
  int descriptor_;
};

}  // namespace accounts
