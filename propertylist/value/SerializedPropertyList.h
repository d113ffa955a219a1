#pragma once

#include <functional>
#include <optional>
#include <string>
#include <string_view>
#include <utility>

#include "propertylist/value/PropertyValue.h"

namespace accounts {

/// A value that is to be written as the bytes of a property-list file, or none. It owns the value;
/// the bytes are made whenever they are asked for, wherever they are to go. A value type: a copy is
/// O(1).
class SerializedPropertyList {
 public:
  /// Takes the next piece of the bytes; false if it wants no more.
  using Taker = std::function<bool(std::string_view)>;
  /// Passes the bytes that stand for a value to a taker as `giveTo` does. Who knows no format can
  /// still hold a value that has one.
  using Encoder = bool (*)(const PropertyValue& value, const Taker& take);

  /// None.
  SerializedPropertyList() = default;
  SerializedPropertyList(PropertyValue value, Encoder encode)
      : value_(std::move(value)), encode_(encode) {}

  /// Null for none; valid as long as this keeps it.
  [[nodiscard]] const PropertyValue* value() const { return value_ ? &*value_ : nullptr; }
  explicit operator bool() const { return value_.has_value(); }

  /// Passes the bytes, no more than 512 kB at a time, to a taker until it wants no more; none has
  /// no bytes. Returns whether it took all. The same value gives the same bytes every time.
  [[nodiscard]] bool giveTo(const Taker& take) const { return !value_ || encode_(*value_, take); }

 private:
  std::optional<PropertyValue> value_;
  Encoder encode_ = nullptr;
};

/// All bytes of a serialised value together.
inline std::string bytesOf(const SerializedPropertyList& serialized) {
  std::string bytes;
  static_cast<void>(serialized.giveTo([&bytes](std::string_view piece) {
    bytes.append(piece);
    return true;
  }));
  return bytes;
}

}  // namespace accounts
