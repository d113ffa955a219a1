#pragma once

#include <nlohmann/json.hpp>
#include <optional>
#include <string>

#include "propertylist/value/PropertyValue.h"

namespace accounts {

/// Objects keep the order in which their keys are put in.
using JSON = nlohmann::ordered_json;

/// A value in JSON: a date as ISO 8601 text, data as "<hex>", NaN and infinities as texts.
JSON jsonOf(const PropertyValue& value);

/// A text, or null for none.
JSON textOrNull(const std::optional<Text>& text);
JSON textOrNull(const std::optional<std::string>& text);

/// A value on one line, without a line end. Bytes that are no UTF-8 are replaced; control
/// characters and marks that reorder text are escaped.
std::string lineOf(const JSON& value);

}  // namespace accounts
