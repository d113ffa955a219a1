#pragma once

#include <string_view>

namespace accounts {

/// One log channel of the system, named by a subsystem and a category.
class LogChannel {
 public:
  virtual ~LogChannel() = default;

  /// Whether lines of the default level are wanted. May be called from any thread.
  [[nodiscard]] virtual bool isEnabled() const = 0;
  /// Writes one line, without its line end, at the default level. May be called from any thread.
  virtual void writeLine(std::string_view line) = 0;
};

/// The system's structured log.
class LogSystem {
 public:
  virtual ~LogSystem() = default;

  /// Makes the channel for a subsystem and a category. It lives as long as the log system.
  virtual LogChannel& makeChannel(std::string_view subsystem, std::string_view category) = 0;
};

}  // namespace accounts
