#pragma once

#include <chrono>
#include <string>

namespace accounts {

/// A line on standard error that is written over and over while something goes on, if standard
/// error is a terminal; nothing otherwise.
class ProgressLine {
 public:
  ProgressLine();
  /// Takes the line away.
  ~ProgressLine();
  ProgressLine(const ProgressLine&) = delete;
  ProgressLine& operator=(const ProgressLine&) = delete;

  /// Whether it is time for a new text: there is a terminal, and the last text is old enough for
  /// eyes.
  [[nodiscard]] bool wantsText() const;
  /// Shows a text in the place of the last one. Control characters must not be in it.
  void show(const std::string& text);

 private:
  const bool hasTerminal_;
  bool isShown_ = false;
  std::chrono::steady_clock::time_point next_;
};

}  // namespace accounts
