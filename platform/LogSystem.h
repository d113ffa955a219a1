#pragma once

#include <cstdint>
#include <string_view>

namespace accounts {

/// One line for a log channel, and what of it a structured log keeps apart.
struct LogLine {
  /// The whole line, without its line end.
  std::string_view text = {};
  /// The full name of the operation that logs; the line begins with it.
  std::string_view operation = {};
  /// The line of the source that logs.
  std::uint32_t sourceLine = 0;
};

/// One log channel of the system, named by a subsystem and a category.
class LogChannel {
 public:
  virtual ~LogChannel() = default;

  /// Whether lines of the default level are wanted. May be called from any thread.
  [[nodiscard]] virtual bool isEnabled() const = 0;
  /// Writes one line at the default level. May be called from any thread.
  virtual void write(const LogLine& line) = 0;
};

/// The system's structured log.
class LogSystem {
 public:
  virtual ~LogSystem() = default;

  /// Makes the channel for a subsystem and a category. It lives as long as the log system.
  virtual LogChannel& makeChannel(std::string_view subsystem, std::string_view category) = 0;
};

}  // namespace accounts
