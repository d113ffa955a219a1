#pragma once

#include <optional>
#include <string>
#include <string_view>

#include "platform/linux/DeviceRoot.h"
#include "platform/linux/FileContents.h"
#include "platform/linux/PathFailure.h"
#include "propertylist/value/PropertyValue.h"

namespace accounts {

/// The dictionary that the bytes of a property-list file stand for. None, with `error` naming the
/// path, when they are malformed or stand for something else.
std::optional<PropertyDictionary> dictionaryFromBytes(std::string_view bytes, std::string_view path,
                                                      Failure& error);

/// The dictionary that a property-list file of the device holds. None, with `error` set, when the
/// file is missing (`error.isMissing()`), cannot be read, is malformed or holds something else.
std::optional<PropertyDictionary> readDictionaryFile(const DeviceRoot& root, std::string_view path,
                                                     Failure& error);

/// The same for a file of the host, outside any device root.
std::optional<PropertyDictionary> readHostDictionaryFile(const std::string& path, Failure& error,
                                                         Pipes pipes = Pipes::Read);

}  // namespace accounts
