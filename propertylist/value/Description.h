#pragma once

#include <string>

#include "propertylist/value/PropertyValue.h"

namespace accounts {

/// Appends a description of a value for an engineer's eyes, always on one line: a text as it
/// stands, with line breaks, control characters and marks that reorder text
/// escaped; everything else as compact JSON with sorted keys, dates as ISO 8601 text and data as
/// "<hex>".
void appendDescription(std::string& line, const PropertyValue& value);

/// The same as a text of its own.
std::string describe(const PropertyValue& value);

/// Appends a text with line breaks, control characters, marks that reorder text and
/// ill-formed sequences escaped.
void appendEscapedText(std::string& line, std::string_view text);
/// A text with the same escaped.
std::string escapedText(std::string_view text);

/// JSON that means the same, in which the same is escaped: they stand nowhere but in its texts.
std::string escapedJSON(std::string json);

}  // namespace accounts
