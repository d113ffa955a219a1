#pragma once

#include <bit>
#include <cstdint>
#include <string_view>

#include "propertylist/value/Text.h"

namespace accounts {

/// A point in time, kept bit for bit as it was read.
struct PropertyDate {
  /// Seconds since 2001-01-01T00:00:00Z; fractions, infinities and NaN included.
  double secondsSinceReferenceDate = 0;

  /// Whether the bits are the same: NaN equals itself, and the two zeros are two.
  friend bool operator==(PropertyDate left, PropertyDate right) {
    return std::bit_cast<std::uint64_t>(left.secondsSinceReferenceDate) ==
           std::bit_cast<std::uint64_t>(right.secondsSinceReferenceDate);
  }
};

/// Opaque bytes.
struct PropertyData {
  PropertyData() = default;
  explicit PropertyData(std::string_view content) : bytes(content) {}
  SharedBytes bytes;

  friend bool operator==(const PropertyData& left, const PropertyData& right) {
    return left.bytes.isSameAs(right.bytes) || left.bytes.view() == right.bytes.view();
  }
};

}  // namespace accounts
