#pragma once

#include <string_view>

#include "propertylist/PropertyListError.h"
#include "propertylist/value/PropertyValue.h"

namespace accounts {

/// The value that the bytes of a property-list file hold, in whichever of the two formats they are.
/// An error says what is wrong and where when they are malformed.
OrPropertyListError<PropertyValue> readPropertyList(std::string_view bytes);

}  // namespace accounts
