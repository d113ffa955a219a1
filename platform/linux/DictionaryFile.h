#pragma once

#include <string_view>

#include "platform/Result.h"
#include "propertylist/value/PropertyValue.h"

namespace accounts {

/// The dictionary that the bytes of a property-list file stand for. A failure, which names the
/// path, when they are malformed or stand for something else.
OrFailure<PropertyDictionary> dictionaryFromBytes(std::string_view bytes, std::string_view path);

}  // namespace accounts
