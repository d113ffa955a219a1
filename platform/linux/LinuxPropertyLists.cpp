#include "platform/linux/LinuxPropertyLists.h"

#include <utility>

#include "platform/linux/DictionaryFile.h"

namespace accounts {

std::optional<PropertyDictionary> LinuxPropertyLists::readDictionary(std::string_view path) {
  const auto bytes = root_.readFile(path);
  return valueOrNone(bytes ? dictionaryFromBytes(*bytes, path) : bytes.error());
}

OrFailure<SerializedPropertyList> LinuxPropertyLists::serializeBinary(const PropertyValue& value) {
  auto serialized = serializer_.serialize(value);
  if (!serialized) {
    return Failure{.text = serialized.error().text};
  }
  return *std::move(serialized);
}

}  // namespace accounts
