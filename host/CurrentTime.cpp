#include "host/CurrentTime.h"

#include <array>
#include <ctime>

namespace accounts {

std::string currentTimeText() {
  const std::time_t now = std::time(nullptr);
  std::tm parts = {};
  gmtime_r(&now, &parts);
  std::array<char, 32> text{};
  const std::size_t length = std::strftime(text.data(), text.size(), "%Y%m%dT%H%M%SZ", &parts);
  return std::string(text.data(), length);
}

}  // namespace accounts
