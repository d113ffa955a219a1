#pragma once

#include "propertylist/PropertyListError.h"
#include "propertylist/value/PropertyValue.h"
#include "propertylist/value/SerializedPropertyList.h"

namespace accounts {

/// A value to be written in the binary format, which the reader of binary files would take back.
/// None, with `error` saying why, for a value that passes one of the limits in PropertyListLimits.h
/// or holds a text that is not well-formed.
SerializedPropertyList serializeBinaryPropertyList(const PropertyValue& value,
                                                   PropertyListError& error);

}  // namespace accounts
