#pragma once

#include <optional>
#include <string_view>

#include "platform/Failure.h"
#include "propertylist/value/PropertyValue.h"

namespace accounts {

/// The dictionary that the bytes of a property-list file stand for. None, with `error` naming the
/// path, when they are malformed or stand for something else.
std::optional<PropertyDictionary> dictionaryFromBytes(std::string_view bytes, std::string_view path,
                                                      Failure& error);

}  // namespace accounts
