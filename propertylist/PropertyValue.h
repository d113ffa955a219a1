#pragma once

#include <concepts>
#include <cstddef>
#include <cstdint>
#include <initializer_list>
#include <iterator>
#include <optional>
#include <span>
#include <string_view>
#include <utility>
#include <vector>

#include "propertylist/PropertyKeys.h"
#include "propertylist/SharedNode.h"
#include "propertylist/SharedRun.h"
#include "propertylist/Text.h"

namespace accounts {

class PropertyValue;
class PropertyEntryIterator;
struct KeyedValue;

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

/// A point in time, kept bit for bit as it was read.
struct PropertyDate {
  /// Seconds since 2001-01-01T00:00:00Z; fractions, infinities and NaN included.
  double secondsSinceReferenceDate = 0;
};

/// Opaque bytes.
struct PropertyData {
  PropertyData() = default;
  explicit PropertyData(std::string_view content) : bytes(content) {}
  explicit PropertyData(SharedBytes content) : bytes(std::move(content)) {}
  SharedBytes bytes;
};

/// An ordered list of values. A value type: a copy is O(1), and a change to one copy is never seen
/// by another.
class PropertyArray {
 public:
  PropertyArray() = default;
  PropertyArray(std::initializer_list<PropertyValue> values);
  explicit PropertyArray(std::vector<PropertyValue> values);
  /// An empty array with room for a number of elements: as many are appended without moving those
  /// before, as long as there is no copy.
  static PropertyArray withRoomFor(std::size_t count);

  [[nodiscard]] std::size_t size() const { return node_ ? run()->size() : 0; }
  [[nodiscard]] bool empty() const { return size() == 0; }
  /// The element at an index, which must be below size().
  [[nodiscard]] const PropertyValue& at(std::size_t index) const;
  [[nodiscard]] const PropertyValue* begin() const;
  [[nodiscard]] const PropertyValue* end() const;
  /// True when an element is the given text.
  [[nodiscard]] bool containsText(std::string_view text) const;

  /// Returns the element in its place.
  const PropertyValue& append(PropertyValue value);
  /// Puts a value in the place of the one at an index, which must be below size().
  void replace(std::size_t index, PropertyValue value);
  /// Removes every element that is the given text.
  void removeText(std::string_view text);

  /// True when both share the same elements in memory: equal without a comparison.
  [[nodiscard]] bool isSameAs(const PropertyArray& other) const {
    return node_.get() == other.node_.get();
  }

  /// Deep equality, in order.
  friend bool operator==(const PropertyArray& left, const PropertyArray& right);

 private:
  friend class SharedNode<PropertyArray>;
  friend class PropertyContent;
  using Run = SharedRun<PropertyValue>;
  [[nodiscard]] Run* run() const { return static_cast<Run*>(node_.get()); }
  static void destroyNode(SharedNodeBase* node) { Run::destroy(node); }
  SharedNode<PropertyArray> node_;
};

/// Values by text key, in the order of the keys' bytes. A value type: a copy is O(1), and a change
/// to one copy is never seen by another. Looking a key up is O(log n).
class PropertyDictionary {
 public:
  PropertyDictionary() = default;
  PropertyDictionary(std::initializer_list<KeyedValue> values);
  /// Takes values in any order, in O(n log n); of those with the same key the last one holds.
  explicit PropertyDictionary(std::vector<KeyedValue> values);
  [[nodiscard]] std::size_t size() const { return node_ ? run()->size() : 0; }
  [[nodiscard]] bool empty() const { return size() == 0; }
  /// The entries in key order.
  [[nodiscard]] PropertyEntryIterator begin() const;
  [[nodiscard]] PropertyEntryIterator end() const;
  /// The keys alone, and the values alone, in the same order.
  [[nodiscard]] const PropertyKeys& keys() const;
  [[nodiscard]] std::span<const PropertyValue> values() const;

  /// The value under a key, null for none; valid until the dictionary changes or goes.
  [[nodiscard]] const PropertyValue* find(std::string_view key) const;
  [[nodiscard]] bool contains(std::string_view key) const { return find(key) != nullptr; }
  /// The text, array or dictionary under a key; none when there is no value or one of another kind.
  [[nodiscard]] std::optional<Text> textForKey(std::string_view key) const;
  [[nodiscard]] std::optional<PropertyArray> arrayForKey(std::string_view key) const;
  [[nodiscard]] std::optional<PropertyDictionary> dictionaryForKey(std::string_view key) const;

  void set(std::string_view key, PropertyValue value);
  void remove(std::string_view key);
  /// Removes the value under a key and returns it; none when there was none.
  std::optional<PropertyValue> take(std::string_view key);

  /// True when both share the same keys and values in memory: equal without a comparison.
  [[nodiscard]] bool isSameAs(const PropertyDictionary& other) const {
    return node_.get() == other.node_.get();
  }
  /// The node, null for an empty one: as long as a handle to it lives, its address names the
  /// content.
  [[nodiscard]] const SharedNodeBase* sharedNode() const { return node_.get(); }

  /// Deep equality.
  friend bool operator==(const PropertyDictionary& left, const PropertyDictionary& right);

 private:
  friend class SharedNode<PropertyDictionary>;
  friend class PropertyContent;
  friend class OrderedValues;
  struct Head : SharedNodeBase {
    PropertyKeys keys;
  };
  using Run = SharedRun<PropertyValue, Head>;
  PropertyDictionary(PropertyKeys keys, std::size_t room);
  [[nodiscard]] Run* run() const { return static_cast<Run*>(node_.get()); }
  static void destroyNode(SharedNodeBase* node) { Run::destroy(node); }
  SharedNode<PropertyDictionary> node_;
};

/// What a value holds: a variant that knows that every kind is either a plain number or one handle
/// to a shared node, so that moving takes no look at the kind and copying only one. Reading a file
/// takes a seventh more instructions with std::variant in its place.
class PropertyContent {
 public:
  /// Those that hold a node come first.
  enum class Form : std::uint8_t {
    Dictionary,
    Array,
    Text,
    Data,
    Signed,
    LargeUnsigned,
    Real,
    Boolean,
    Date
  };

  explicit PropertyContent(PropertyDictionary content)
      : form_(Form::Dictionary), dictionary(std::move(content)) {}
  explicit PropertyContent(PropertyArray content) : form_(Form::Array), array(std::move(content)) {}
  explicit PropertyContent(Text content) : form_(Form::Text), text(std::move(content)) {}
  explicit PropertyContent(PropertyData content) : form_(Form::Data), data(std::move(content)) {}
  explicit PropertyContent(std::int64_t content) : form_(Form::Signed), signedInteger(content) {}
  explicit PropertyContent(std::uint64_t content)
      : form_(Form::LargeUnsigned), unsignedInteger(content) {}
  explicit PropertyContent(double content) : form_(Form::Real), real(content) {}
  explicit PropertyContent(bool content) : form_(Form::Boolean), bits_(0) { boolean = content; }
  explicit PropertyContent(PropertyDate content) : form_(Form::Date), date(content) {}

  PropertyContent(const PropertyContent& other) : form_(other.form_), bits_(other.bits_) {
    if (holdsNode()) {
      node_->retain();
    }
  }
  PropertyContent(PropertyContent&& other) noexcept
      : form_(std::exchange(other.form_, Form::Signed)), bits_(other.bits_) {}
  PropertyContent& operator=(PropertyContent other) noexcept {
    std::swap(form_, other.form_);
    std::swap(bits_, other.bits_);
    return *this;
  }
  ~PropertyContent() {
    if (holdsNode() && node_->releaseIsLast()) {
      destroyNode();
    }
  }

  [[nodiscard]] Form form() const { return form_; }

 private:
  [[nodiscard]] bool holdsNode() const { return form_ <= Form::Data && node_ != nullptr; }
  void destroyNode();

  Form form_;

 public:
  /// Which of them there is, the form says.
  union {
    PropertyDictionary dictionary;
    PropertyArray array;
    Text text;
    PropertyData data;
    std::int64_t signedInteger;
    std::uint64_t unsignedInteger;
    double real;
    bool boolean;
    PropertyDate date;
    /// Whatever there is as plain bits, or as the node of one of the first four.
    std::uint64_t bits_;
    SharedNodeBase* node_;
  };
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
  PropertyValue(std::string_view text) : content_(Text(text)) {}
  PropertyValue(const std::string& text) : content_(Text(text)) {}
  PropertyValue(const char* text) : content_(Text(text)) {}
  PropertyValue(PropertyDate date) : content_(date) {}
  PropertyValue(PropertyData data) : content_(std::move(data)) {}
  // A template, so that no pointer becomes a boolean by an implicit conversion.
  template <std::same_as<bool> Boolean>
  PropertyValue(Boolean boolean) : content_(boolean) {}
  template <std::signed_integral Signed>
  PropertyValue(Signed integer) : content_(std::int64_t{integer}) {}
  template <std::unsigned_integral Unsigned>
  requires(!std::same_as<Unsigned, bool>) PropertyValue(Unsigned integer)
      : content_(contentOf(integer)) {}
  template <std::floating_point Real>
  PropertyValue(Real real) : content_(static_cast<double>(real)) {}

  [[nodiscard]] PropertyKind kind() const {
    constexpr PropertyKind kinds[] = {
        PropertyKind::Dictionary, PropertyKind::Array,   PropertyKind::String,
        PropertyKind::Data,       PropertyKind::Integer, PropertyKind::Integer,
        PropertyKind::Real,       PropertyKind::Boolean, PropertyKind::Date};
    return kinds[static_cast<std::size_t>(content_.form())];
  }

  /// The content as one kind; null or none when the value is of another.
  [[nodiscard]] const PropertyDictionary* asDictionary() const {
    return content_.form() == Form::Dictionary ? &content_.dictionary : nullptr;
  }
  [[nodiscard]] const PropertyArray* asArray() const {
    return content_.form() == Form::Array ? &content_.array : nullptr;
  }
  [[nodiscard]] const Text* asText() const {
    return content_.form() == Form::Text ? &content_.text : nullptr;
  }
  [[nodiscard]] const PropertyData* asData() const {
    return content_.form() == Form::Data ? &content_.data : nullptr;
  }
  [[nodiscard]] const PropertyDate* asDate() const {
    return content_.form() == Form::Date ? &content_.date : nullptr;
  }
  [[nodiscard]] const double* asReal() const {
    return content_.form() == Form::Real ? &content_.real : nullptr;
  }
  [[nodiscard]] const bool* asBoolean() const {
    return content_.form() == Form::Boolean ? &content_.boolean : nullptr;
  }
  /// An integer from -2^63 to 2^63-1; null for any other value, a larger integer included.
  [[nodiscard]] const std::int64_t* asSigned() const {
    return content_.form() == Form::Signed ? &content_.signedInteger : nullptr;
  }
  /// An integer from 2^63 to 2^64-1; null for any other value, a smaller integer included.
  [[nodiscard]] const std::uint64_t* asLargeUnsigned() const {
    return content_.form() == Form::LargeUnsigned ? &content_.unsignedInteger : nullptr;
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
  using Form = PropertyContent::Form;

  // Integers that fit are always held signed, so that equal numbers have one form.
  static PropertyContent contentOf(std::uint64_t integer) {
    constexpr std::uint64_t kTwoToThe63 = std::uint64_t{1} << 63;
    return integer < kTwoToThe63 ? PropertyContent(static_cast<std::int64_t>(integer))
                                 : PropertyContent(integer);
  }

  PropertyContent content_;
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

/// The values of a dictionary in the making, of which the keys are known: each keeps its place in
/// memory, in the dictionary that is made of them too.
class OrderedValues {
 public:
  OrderedValues() = default;
  explicit OrderedValues(PropertyKeys keys);

  /// Adds the next key's value, not more of them than there are keys, and returns it in its place.
  const PropertyValue& append(PropertyValue value) {
    return values_.run()->append(std::move(value));
  }
  /// The dictionary, once each key has its value.
  [[nodiscard]] PropertyDictionary take() { return std::move(values_); }

 private:
  /// One only when it is taken.
  PropertyDictionary values_;
};

inline const PropertyValue* PropertyArray::begin() const {
  return node_ ? run()->begin() : nullptr;
}
inline const PropertyValue* PropertyArray::end() const {
  return node_ ? run()->end() : nullptr;
}
inline PropertyEntryIterator PropertyDictionary::begin() const {
  return node_ ? PropertyEntryIterator(run()->keys.begin(), run()->begin())
               : PropertyEntryIterator();
}
inline PropertyEntryIterator PropertyDictionary::end() const {
  return node_ ? PropertyEntryIterator(run()->keys.begin() + run()->size(), run()->end())
               : PropertyEntryIterator();
}
inline const PropertyKeys& PropertyDictionary::keys() const {
  static const PropertyKeys kNone;
  return node_ ? run()->keys : kNone;
}
inline std::span<const PropertyValue> PropertyDictionary::values() const {
  return node_ ? std::span<const PropertyValue>(run()->begin(), run()->size())
               : std::span<const PropertyValue>();
}

}  // namespace accounts
