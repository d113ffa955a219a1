#pragma once

#include <string_view>

#include "propertylist/value/Text.h"

namespace accounts {

/// A point in time, kept bit for bit as it was read.
struct PropertyDate {
  /// Seconds since 2001-01-01T00:00:00Z; fractions, infinities and NaN included.
  double secondsSinceReferenceDate = 0;
};

/// Opaque bytes.
struct PropertyData {
  PropertyData() = default;
  explicit PropertyData(std::string_view content) : bytes(content) {}
  SharedBytes bytes;
};

}  // namespace accounts
