#pragma once

#include <chrono>
#include <functional>
#include <string>
#include <string_view>

#include "platform/DateFormatter.h"

namespace accounts {

/// Reads the local time zone now, so that nothing needs to be opened for a date from then on.
void readLocalTimeZoneAhead();

/// Dates by the C library. The calendar of weeks is that of ISO 8601: weeks begin on Monday, and
/// the first one of a year holds its first Thursday.
class LinuxDateFormatter final : public DateFormatter {
 public:
  using Clock = std::function<std::chrono::system_clock::time_point()>;

  explicit LinuxDateFormatter(Clock clock = std::chrono::system_clock::now);

  /// Fields of more than one letter are padded with zeros to that length; more than one S gives
  /// that many digits of the second's fraction. Letters without a field stand for themselves.
  std::string currentDate(std::string_view pattern) override;

 private:
  Clock clock_;
};

}  // namespace accounts
