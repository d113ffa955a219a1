#pragma once

#include <string>
#include <string_view>

#include "propertylist/PropertyListError.h"
#include "propertylist/value/PropertyValue.h"

namespace accounts {

/// Whether bytes begin as a binary property list does.
bool isBinaryPropertyList(std::string_view bytes);

/// The value that a binary property list, version 1.0 ("bplist00"), holds. An error says what is
/// wrong and at which offset when the bytes are malformed or pass one of the limits in
/// PropertyListLimits.h.
OrPropertyListError<PropertyValue> readBinaryPropertyList(std::string_view bytes);

/// A value as a binary property list, each distinct scalar and container written once. The same
/// value always gives the same bytes. An error says why for a value that the reader would not take
/// back.
OrPropertyListError<std::string> writeBinaryPropertyList(const PropertyValue& value);

}  // namespace accounts
