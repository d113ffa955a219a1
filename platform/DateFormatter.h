#pragma once

#include <string>
#include <string_view>

namespace accounts {

/// Dates as text.
class DateFormatter {
 public:
  virtual ~DateFormatter() = default;

  /// The current date and time in the local time zone, by a Unicode date-format pattern. A run of
  /// one letter is a field (Y year of the week-based calendar, M month, d day, H hour 0 to 23, S
  /// tenths of a second), unpadded when the run has length one; every character that is no letter
  /// stands for itself.
  virtual std::string currentDate(std::string_view pattern) = 0;
};

}  // namespace accounts
