#include "platform/overlay/OverlayPropertyLists.h"

#include "propertylist/PropertyListFile.h"

namespace accounts {

std::optional<PropertyDictionary> OverlayPropertyLists::readDictionary(std::string_view path) {
  const OverlayFileSystem::Contents contents = files_.contentsOf(path);
  if (const auto* beneath = std::get_if<OverlayFileSystem::Beneath>(&contents)) {
    return beneath_.readDictionary(beneath->path);
  }
  const auto* inMemory = std::get_if<OverlayFileSystem::InMemory>(&contents);
  if (inMemory == nullptr) {
    return std::nullopt;
  }
  PropertyListError malformed;
  const std::optional<PropertyValue> value = readPropertyList(*inMemory->bytes, malformed);
  const PropertyDictionary* const dictionary = value ? value->asDictionary() : nullptr;
  return dictionary != nullptr ? std::optional(*dictionary) : std::nullopt;
}

Result OverlayPropertyLists::serializeBinary(const PropertyValue& value,
                                             SerializedPropertyList& serialized) {
  return beneath_.serializeBinary(value, serialized);
}

}  // namespace accounts
