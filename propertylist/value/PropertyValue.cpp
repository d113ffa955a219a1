#include "propertylist/value/PropertyValue.h"

#include <bit>
#include <limits>
#include <string>
#include <type_traits>

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
  return left.content_.index() == right.content_.index() &&
         std::visit(
             [&right](const auto& content) {
               using Content = std::remove_cvref_t<decltype(content)>;
               const Content& other = *std::get_if<Content>(&right.content_);
               if constexpr (std::same_as<Content, double>) {
                 return std::bit_cast<std::uint64_t>(content) ==
                        std::bit_cast<std::uint64_t>(other);
               } else {
                 return content == other;
               }
             },
             left.content_);
}

}  // namespace accounts
