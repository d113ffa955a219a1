#include "host/CurrentTime.h"

#include <array>
#include <ctime>

namespace accounts {

namespace {

std::string currentTime(const char* format) {
  const std::time_t now = std::time(nullptr);
  std::tm parts = {};
  gmtime_r(&now, &parts);
  std::array<char, 32> text{};
  const std::size_t length = std::strftime(text.data(), text.size(), format, &parts);
  return std::string(text.data(), length);
}

}  // namespace

std::string currentTimeText() {
  return currentTime("%Y%m%dT%H%M%SZ");
}

std::string currentTimeForReports() {
  return currentTime("%Y-%m-%dT%H:%M:%SZ");
}

}  // namespace accounts
