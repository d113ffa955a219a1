#include "platform/linux/LinuxPropertyLists.h"

#include <utility>

#include "platform/linux/DictionaryFile.h"
#include "propertylist/BinaryPropertyList.h"

namespace accounts {

std::optional<PropertyDictionary> LinuxPropertyLists::readDictionary(std::string_view path) {
  PathError error;
  return readDictionary(path, error);
}

std::optional<PropertyDictionary> LinuxPropertyLists::readDictionary(std::string_view path,
                                                                     PathError& error) {
  return readDictionaryFile(root_, path, error);
}

Result LinuxPropertyLists::serializeBinary(const PropertyValue& value, std::string& bytes) {
  PropertyListError error;
  auto written = writeBinaryPropertyList(value, error);
  if (!written) {
    bytes.clear();
    return Result::failure(std::move(error.text));
  }
  bytes = std::move(*written);
  return Result::success();
}

}  // namespace accounts
