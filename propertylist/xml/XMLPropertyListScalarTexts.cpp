#include <charconv>
#include <cmath>
#include <string>

#include "propertylist/value/Description.h"
#include "propertylist/value/GeneralisedUTF8.h"
#include "propertylist/xml/XMLPropertyListScalars.h"

namespace accounts::xmlplist {

namespace {

template <class Number>
std::string digitsOf(Number number) {
  char digits[32];
  const auto result = std::to_chars(std::begin(digits), std::end(digits), number);
  return {digits, result.ptr};
}

/// A text, if reading it gives the value again, bit for bit.
std::optional<std::string> ifRead(const std::optional<PropertyValue>& read,
                                  const PropertyValue& value, std::string text) {
  return read == value ? std::optional(std::move(text)) : std::nullopt;
}

/// What stands in the place of a character in XML; empty when the character stands for itself.
std::string_view referenceFor(char character) {
  switch (character) {
    case '&':
      return "&amp;";
    case '<':
      return "&lt;";
    case '>':
      return "&gt;";
    case '\r':
      // As it stands, a reader would take it for a line feed.
      return "&#13;";
    default:
      return {};
  }
}

bool isAllowedInXML(char32_t codePoint) {
  constexpr char32_t kFirstNonCharacter = 0xFFFE;
  constexpr char32_t kLastNonCharacter = 0xFFFF;
  const bool isControl =
      codePoint < 0x20 && codePoint != '\t' && codePoint != '\n' && codePoint != '\r';
  return !isControl && !isSurrogate(codePoint) && codePoint != kFirstNonCharacter &&
         codePoint != kLastNonCharacter;
}

}  // namespace

std::string integerText(const PropertyValue& integer) {
  return integer.asSigned() != nullptr ? digitsOf(*integer.asSigned())
                                       : digitsOf(*integer.asLargeUnsigned());
}

std::optional<std::string> realText(double real) {
  std::string text = digitsOf(real);
  if (std::isnan(real)) {
    text = std::signbit(real) ? "-nan" : "nan";
  }
  return ifRead(parseReal(text), real, text);
}

std::optional<std::string> dateText(PropertyDate date) {
  std::string description;
  appendDescription(description, date);
  const std::string text = description.substr(1, description.size() - 2);
  return ifRead(parseDate(text), date, text);
}

std::string dataText(std::string_view bytes) {
  constexpr std::string_view kDigits =
      "ABCDEFGHIJKLMNOPQRSTUVWXYZabcdefghijklmnopqrstuvwxyz0123456789+/";
  constexpr std::size_t kGroupSize = 3;
  std::string text;
  text.reserve((bytes.size() + 2) / kGroupSize * 4);
  while (!bytes.empty()) {
    const std::string_view group = bytes.substr(0, kGroupSize);
    bytes.remove_prefix(group.size());
    std::uint32_t bits = 0;
    for (std::size_t index = 0; index < kGroupSize; ++index) {
      bits = bits << 8 | (index < group.size() ? static_cast<unsigned char>(group[index]) : 0U);
    }
    // A group of one byte has two digits, one of two bytes three.
    for (std::size_t digit = 0; digit <= kGroupSize; ++digit) {
      text += digit <= group.size() ? kDigits[bits >> (6 * (kGroupSize - digit)) & 0x3F] : '=';
    }
  }
  return text;
}

bool appendCharacters(std::string& output, std::string_view text) {
  while (!text.empty()) {
    const DecodedCodePoint decoded = decodeCodePoint(text);
    if (decoded.length == 0 || !isAllowedInXML(decoded.value)) {
      return false;
    }
    const std::string_view reference = referenceFor(text.front());
    if (decoded.value >= 0x7F && isControlOrReordering(decoded.value)) {
      output.append("&#").append(digitsOf(static_cast<std::uint32_t>(decoded.value))).append(";");
    } else {
      output += reference.empty() ? text.substr(0, decoded.length) : reference;
    }
    text.remove_prefix(decoded.length);
  }
  return true;
}

}  // namespace accounts::xmlplist
