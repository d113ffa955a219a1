#pragma once

#include <concepts>
#include <cstddef>
#include <cstdint>
#include <iterator>
#include <optional>
#include <string>
#include <string_view>
#include <utility>
#include <variant>

#include "propertylist/value/PropertyArray.h"
#include "propertylist/value/PropertyDictionary.h"
#include "propertylist/value/PropertyScalars.h"
#include "propertylist/value/Text.h"

namespace accounts {

/// The kinds of value that a property list holds. Boolean is a kind of its own: the integer 1 is
/// not true.
enum class PropertyKind : std::uint8_t {
  Dictionary,
  Array,
  String,
  Integer,
  Real,
  Boolean,
  Date,
  Data
};

/// One value of a property list, of any kind. Copying is O(1). Equality is deep, takes a shortcut
/// where two values share memory, and compares reals and dates by their bits, so that NaN equals
/// itself and a value that was written and read again equals the original. Values of different
/// kinds are never equal.
class PropertyValue {
 public:
  PropertyValue(PropertyDictionary dictionary) : content_(std::move(dictionary)) {}
  PropertyValue(PropertyArray array) : content_(std::move(array)) {}
  PropertyValue(Text text) : content_(std::move(text)) {}
  PropertyValue(std::string_view text) : content_(std::in_place_type<Text>, text) {}
  PropertyValue(const std::string& text) : content_(std::in_place_type<Text>, text) {}
  PropertyValue(const char* text) : content_(std::in_place_type<Text>, text) {}
  PropertyValue(PropertyDate date) : content_(date) {}
  PropertyValue(PropertyData data) : content_(std::move(data)) {}
  // A template, so that no pointer becomes a boolean by an implicit conversion.
  template <std::same_as<bool> Boolean>
  PropertyValue(Boolean boolean) : content_(std::in_place_type<bool>, boolean) {}
  template <std::signed_integral Signed>
  PropertyValue(Signed integer) : content_(std::in_place_type<std::int64_t>, integer) {}
  template <std::unsigned_integral Unsigned>
  requires(!std::same_as<Unsigned, bool>) PropertyValue(Unsigned integer)
      : content_(contentOf(integer)) {}
  template <std::floating_point Real>
  PropertyValue(Real real) : content_(std::in_place_type<double>, real) {}

  [[nodiscard]] PropertyKind kind() const {
    // In the order of the content's types.
    constexpr PropertyKind kKinds[] = {
        PropertyKind::Dictionary, PropertyKind::Array,   PropertyKind::String,
        PropertyKind::Data,       PropertyKind::Integer, PropertyKind::Integer,
        PropertyKind::Real,       PropertyKind::Boolean, PropertyKind::Date};
    return kKinds[content_.index()];
  }

  /// The content as one kind; null or none when the value is of another.
  [[nodiscard]] const PropertyDictionary* asDictionary() const {
    return std::get_if<PropertyDictionary>(&content_);
  }
  [[nodiscard]] const PropertyArray* asArray() const {
    return std::get_if<PropertyArray>(&content_);
  }
  [[nodiscard]] const Text* asText() const { return std::get_if<Text>(&content_); }
  [[nodiscard]] const PropertyData* asData() const { return std::get_if<PropertyData>(&content_); }
  [[nodiscard]] const PropertyDate* asDate() const { return std::get_if<PropertyDate>(&content_); }
  [[nodiscard]] const double* asReal() const { return std::get_if<double>(&content_); }
  [[nodiscard]] const bool* asBoolean() const { return std::get_if<bool>(&content_); }
  /// An integer from -2^63 to 2^63-1; null for any other value, a larger integer included.
  [[nodiscard]] const std::int64_t* asSigned() const {
    return std::get_if<std::int64_t>(&content_);
  }
  /// An integer from 2^63 to 2^64-1; null for any other value, a smaller integer included.
  [[nodiscard]] const std::uint64_t* asLargeUnsigned() const {
    return std::get_if<std::uint64_t>(&content_);
  }

  /// The value read as an integer: the integer part of a number (held to the range of 64 signed
  /// bits, 0 for NaN), 0 or 1 of a boolean, the leading decimal integer of a text (blanks first
  /// skipped, an optional sign, 0 if there is none). None for any other kind.
  [[nodiscard]] std::optional<std::int64_t> integerValue() const;

  /// The value read as a boolean: a boolean itself; a number unless it is 0; a text when, after
  /// blanks, an optional sign and zeros, its next character is one of Y y T t 1 to 9. None for any
  /// other kind.
  [[nodiscard]] std::optional<bool> booleanValue() const;

  friend bool operator==(const PropertyValue& left, const PropertyValue& right);

 private:
  using Content = std::variant<PropertyDictionary, PropertyArray, Text, PropertyData, std::int64_t,
                               std::uint64_t, double, bool, PropertyDate>;
  // Most of what a migration keeps in memory are values.
  static_assert(sizeof(Content) == 2 * sizeof(std::uint64_t));

  // Integers that fit are always held signed, so that equal numbers have one form.
  static Content contentOf(std::uint64_t integer) {
    constexpr std::uint64_t kTwoToThe63 = std::uint64_t{1} << 63;
    return integer < kTwoToThe63 ? Content(static_cast<std::int64_t>(integer)) : Content(integer);
  }

  Content content_;
};

/// A value with the key that it is to have in a dictionary.
struct KeyedValue {
  Text key;
  PropertyValue value;
};

/// One key of a dictionary with its value, both valid until the dictionary changes or goes.
struct PropertyEntry {
  const Text& key;
  const PropertyValue& value;
};

/// Goes through the entries of a dictionary.
class PropertyEntryIterator {
 public:
  using iterator_concept = std::forward_iterator_tag;
  using iterator_category = std::input_iterator_tag;
  using difference_type = std::ptrdiff_t;
  using value_type = PropertyEntry;
  using reference = PropertyEntry;
  struct pointer {
    PropertyEntry entry;
    const PropertyEntry* operator->() const { return &entry; }
  };

  PropertyEntryIterator() = default;
  PropertyEntryIterator(const Text* key, const PropertyValue* value) : key_(key), value_(value) {}

  PropertyEntry operator*() const { return {*key_, *value_}; }
  pointer operator->() const { return {**this}; }
  PropertyEntryIterator& operator++() { return *this += 1; }
  PropertyEntryIterator operator++(int) { return std::exchange(*this, {key_ + 1, value_ + 1}); }
  PropertyEntryIterator& operator+=(difference_type count) {
    key_ += count;
    value_ += count;
    return *this;
  }
  friend bool operator==(const PropertyEntryIterator& left, const PropertyEntryIterator& right) {
    return left.value_ == right.value_;
  }

 private:
  const Text* key_ = nullptr;
  const PropertyValue* value_ = nullptr;
};

inline PropertyEntryIterator PropertyDictionary::begin() const {
  return node_ ? PropertyEntryIterator(run()->keys.begin(), run()->begin())
               : PropertyEntryIterator();
}
inline PropertyEntryIterator PropertyDictionary::end() const {
  return node_ ? PropertyEntryIterator(run()->keys.begin() + run()->size(), run()->end())
               : PropertyEntryIterator();
}

}  // namespace accounts
