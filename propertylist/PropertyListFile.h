#pragma once

#include <optional>
#include <string_view>

#include "propertylist/PropertyListError.h"
#include "propertylist/value/PropertyValue.h"

namespace accounts {

/// The value that the bytes of a property-list file hold, in whichever of the two formats they are.
/// None, with `error` saying what is wrong and where, when they are malformed.
std::optional<PropertyValue> readPropertyList(std::string_view bytes, PropertyListError& error);

}  // namespace accounts
