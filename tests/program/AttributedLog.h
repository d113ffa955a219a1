#pragma once

#include <sys/types.h>

#include <chrono>
#include <optional>
#include <string>
#include <vector>

namespace accounts {

/// A standard error for many processes at once, whose reader gets their lines in the order in which
/// they were written, each with the process that wrote it.
class AttributedLog {
 public:
  struct Line {
    pid_t writer;
    std::string text;
  };

  AttributedLog();
  ~AttributedLog();
  AttributedLog(const AttributedLog&) = delete;
  AttributedLog& operator=(const AttributedLog&) = delete;

  /// The descriptor to be the standard error of processes; to be closed with closeWriter() once all
  /// of them have been started.
  [[nodiscard]] int writer() const { return writer_; }
  void closeWriter();

  /// The next line, waiting for it. None when no process is left that could write one, or, as a
  /// failure of the test, when nothing happens for as long as this.
  std::optional<Line> next(std::chrono::seconds timeLimit);

 private:
  int reader_ = -1;
  int writer_ = -1;
  std::vector<char> buffer_;
};

}  // namespace accounts
