#include "accountsctl/ProgressLine.h"

#include <unistd.h>

#include <iostream>

namespace accounts {
namespace {

constexpr auto kInterval = std::chrono::milliseconds(100);
// To the beginning of the line, and what stands there erased.
constexpr const char* kErase = "\r\033[K";

}  // namespace

ProgressLine::ProgressLine() : hasTerminal_(isatty(STDERR_FILENO) == 1) {}

ProgressLine::~ProgressLine() {
  if (isShown_) {
    std::cerr << kErase << std::flush;
  }
}

bool ProgressLine::wantsText() const {
  return hasTerminal_ && std::chrono::steady_clock::now() >= next_;
}

void ProgressLine::show(const std::string& text) {
  std::cerr << kErase << text << std::flush;
  isShown_ = true;
  next_ = std::chrono::steady_clock::now() + kInterval;
}

}  // namespace accounts
