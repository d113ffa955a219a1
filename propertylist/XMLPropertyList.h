#pragma once

#include <optional>
#include <string_view>

#include "propertylist/PropertyListError.h"
#include "propertylist/PropertyValue.h"

namespace accounts {

/// The value that an XML property list holds. A document type is skipped; entities other than XML's
/// own five and external references are refused. None, with `error` saying what is wrong and at
/// which line, when the bytes are malformed or pass one of the limits in PropertyListLimits.h.
std::optional<PropertyValue> readXMLPropertyList(std::string_view bytes, PropertyListError& error);

}  // namespace accounts
