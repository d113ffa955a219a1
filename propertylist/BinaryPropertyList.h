#pragma once

#include <optional>
#include <string>
#include <string_view>

#include "propertylist/PropertyListError.h"
#include "propertylist/PropertyValue.h"
#include "propertylist/SerializedPropertyList.h"

namespace accounts {

/// Whether bytes begin as a binary property list does.
bool isBinaryPropertyList(std::string_view bytes);

/// The value that a binary property list, version 1.0 ("bplist00"), holds. None, with `error`
/// saying what is wrong and at which offset, when the bytes are malformed or pass one of the limits
/// in PropertyListLimits.h.
std::optional<PropertyValue> readBinaryPropertyList(std::string_view bytes,
                                                    PropertyListError& error);

/// A value as a binary property list, each distinct scalar and container written once. The same
/// value always gives the same bytes. None, with `error` saying why, for a value that the reader
/// would not take back.
std::optional<std::string> writeBinaryPropertyList(const PropertyValue& value,
                                                   PropertyListError& error);

/// Passes the same bytes, no more than 512 kB at a time, to a taker until it wants no more. Returns
/// whether it took all; false also for a value that the reader would not take back.
bool giveBinaryPropertyList(const PropertyValue& value, const SerializedPropertyList::Taker& take);

}  // namespace accounts
