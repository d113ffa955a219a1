#include "platform/linux/LinuxPropertyLists.h"

#include <utility>

#include "platform/linux/DictionaryFile.h"

namespace accounts {

std::optional<PropertyDictionary> LinuxPropertyLists::readDictionary(std::string_view path) {
  const auto bytes = root_.readFile(path);
  return valueOrNone(bytes ? dictionaryFromBytes(*bytes, path) : bytes.error());
}

Result LinuxPropertyLists::serializeBinary(const PropertyValue& value,
                                           SerializedPropertyList& serialized) {
  PropertyListError error;
  serialized = serializer_.serialize(value, error);
  return serialized ? Result() : Failure{.text = std::move(error.text)};
}

}  // namespace accounts
