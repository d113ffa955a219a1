#pragma once

#include <optional>
#include <string>
#include <string_view>

#include "propertylist/value/PropertyValue.h"

/// The contents of the scalar elements of XML property lists. Each reading function takes the text
/// between the tags and gives none for anything that is not wholly in the element's form. Blanks
/// around a number or date are no part of it. Each writing function gives a text that is read as
/// the value again, bit for bit, and none where there is no such text.
namespace accounts::xmlplist {

/// XML's own blanks: space, tabulator, line feed, carriage return.
inline bool isBlank(char character) {
  return character == ' ' || character == '\t' || character == '\n' || character == '\r';
}
inline bool isBlank(std::string_view text) {
  for (const char character : text) {
    if (!isBlank(character)) {
      return false;
    }
  }
  return true;
}

/// An integer from -2^63 to 2^64-1: an optional sign, then decimal digits, or "0x" and hexadecimal
/// ones.
std::optional<PropertyValue> parseInteger(std::string_view text);

/// A decimal number within the range of a double, or "nan", "inf" or "infinity" in letters of
/// either case; an optional sign before any of them.
std::optional<PropertyValue> parseReal(std::string_view text);

/// An existing point in time as "YYYY-MM-DDTHH:MM:SSZ".
std::optional<PropertyValue> parseDate(std::string_view text);

/// Bytes as base64, padded, with blanks anywhere.
std::optional<PropertyValue> parseData(std::string_view text);

/// Writing (XMLPropertyListScalarTexts.cpp).
/// `integer` must be one.
std::string integerText(const PropertyValue& integer);
/// None for a NaN whose bits are not those of `parseReal`'s.
std::optional<std::string> realText(double real);
/// None for anything but a whole second of the years 0 to 9999.
std::optional<std::string> dateText(PropertyDate date);
/// Base64 without blanks.
std::string dataText(std::string_view bytes);
/// Appends a text with what XML reserves replaced by references. False, with a part of the text
/// appended, when it has a character that XML forbids or is not well-formed UTF-8.
bool appendCharacters(std::string& output, std::string_view text);

}  // namespace accounts::xmlplist
