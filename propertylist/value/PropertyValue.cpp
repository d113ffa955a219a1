#include "propertylist/value/PropertyValue.h"

#include <bit>
#include <limits>
#include <string>

namespace accounts {

namespace {

constexpr std::int64_t kLargestSigned = std::numeric_limits<std::int64_t>::max();
constexpr std::int64_t kSmallestSigned = std::numeric_limits<std::int64_t>::min();

bool isBlank(char character) {
  return character == ' ' || (character >= '\t' && character <= '\r');
}

bool isDigit(char character) {
  return character >= '0' && character <= '9';
}

std::string_view withoutLeadingBlanks(std::string_view text) {
  while (!text.empty() && isBlank(text.front())) {
    text.remove_prefix(1);
  }
  return text;
}

std::int64_t leadingInteger(std::string_view text) {
  text = withoutLeadingBlanks(text);
  bool isNegative = false;
  if (!text.empty() && (text.front() == '-' || text.front() == '+')) {
    isNegative = text.front() == '-';
    text.remove_prefix(1);
  }
  // Counted downward, since the negative range is the larger one.
  std::int64_t result = 0;
  for (; !text.empty() && isDigit(text.front()); text.remove_prefix(1)) {
    const int digit = text.front() - '0';
    if (result < (kSmallestSigned + digit) / 10) {
      return isNegative ? kSmallestSigned : kLargestSigned;
    }
    result = result * 10 - digit;
  }
  if (isNegative) {
    return result;
  }
  return result == kSmallestSigned ? kLargestSigned : -result;
}

std::int64_t integerPart(double real) {
  constexpr double kTwoToThe63 = 9223372036854775808.0;
  if (real != real) {
    return 0;
  }
  if (real >= kTwoToThe63) {
    return kLargestSigned;
  }
  return real < -kTwoToThe63 ? kSmallestSigned : static_cast<std::int64_t>(real);
}

bool textMeansTrue(std::string_view text) {
  text = withoutLeadingBlanks(text);
  if (!text.empty() && (text.front() == '-' || text.front() == '+')) {
    text.remove_prefix(1);
  }
  while (!text.empty() && text.front() == '0') {
    text.remove_prefix(1);
  }
  return !text.empty() &&
         std::string_view("YyTt123456789").find(text.front()) != std::string_view::npos;
}

}  // namespace

// Copying and moving rely on it.
static_assert(sizeof(PropertyDictionary) == sizeof(SharedNodeBase*));
static_assert(sizeof(PropertyArray) == sizeof(SharedNodeBase*));
static_assert(sizeof(Text) == sizeof(SharedNodeBase*));
static_assert(sizeof(PropertyData) == sizeof(SharedNodeBase*));
static_assert(sizeof(PropertyContent) == 2 * sizeof(std::uint64_t));

void PropertyContent::destroyNode() {
  switch (form_) {
    case Form::Dictionary:
      return PropertyDictionary::destroyNode(node_);
    case Form::Array:
      return PropertyArray::destroyNode(node_);
    default:
      return SharedBytes::destroyNode(node_);
  }
}

std::optional<std::int64_t> PropertyValue::integerValue() const {
  if (const std::int64_t* integer = asSigned()) {
    return *integer;
  }
  if (asLargeUnsigned() != nullptr) {
    return kLargestSigned;
  }
  if (const double* real = asReal()) {
    return integerPart(*real);
  }
  if (const bool* boolean = asBoolean()) {
    return *boolean ? 1 : 0;
  }
  if (const Text* text = asText()) {
    return leadingInteger(*text);
  }
  return std::nullopt;
}

std::optional<bool> PropertyValue::booleanValue() const {
  if (const bool* boolean = asBoolean()) {
    return *boolean;
  }
  if (const std::int64_t* integer = asSigned()) {
    return *integer != 0;
  }
  if (asLargeUnsigned() != nullptr) {
    return true;
  }
  if (const double* real = asReal()) {
    return *real != 0;
  }
  if (const Text* text = asText()) {
    return textMeansTrue(*text);
  }
  return std::nullopt;
}

bool operator==(const PropertyValue& left, const PropertyValue& right) {
  using Form = PropertyContent::Form;
  const PropertyContent& content = left.content_;
  const PropertyContent& other = right.content_;
  if (content.form() != other.form()) {
    return false;
  }
  switch (content.form()) {
    case Form::Dictionary:
      return content.dictionary == other.dictionary;
    case Form::Array:
      return content.array == other.array;
    case Form::Text:
      return content.text == other.text;
    case Form::Data:
      return content.data.bytes.isSameAs(other.data.bytes) ||
             content.data.bytes.view() == other.data.bytes.view();
    case Form::Boolean:
      return content.boolean == other.boolean;
    case Form::Real:
      return std::bit_cast<std::uint64_t>(content.real) == std::bit_cast<std::uint64_t>(other.real);
    case Form::Date:
      return std::bit_cast<std::uint64_t>(content.date.secondsSinceReferenceDate) ==
             std::bit_cast<std::uint64_t>(other.date.secondsSinceReferenceDate);
    case Form::Signed:
      return content.signedInteger == other.signedInteger;
    case Form::LargeUnsigned:
      return content.unsignedInteger == other.unsignedInteger;
  }
  return false;
}

}  // namespace accounts
