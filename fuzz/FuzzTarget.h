#pragma once

#include <string_view>

#include "propertylist/value/PropertyValue.h"

namespace accounts {

/// What a fuzz target does with one input; each target defines it once. It must come to an end for
/// any bytes, and ends the process, by `require` or a sanitizer, when it finds a fault.
void runOneInput(std::string_view bytes);

/// Ends the process with a sentence, which says what should have held, unless it holds.
void require(bool holds, std::string_view sentence);

/// Ends the process with a sentence and both values unless they are equal.
void requireEqual(const PropertyValue& actual, const PropertyValue& expected,
                  std::string_view sentence);

}  // namespace accounts
