#include "platform/linux/DictionaryFile.h"

#include "platform/linux/FileContents.h"
#include "propertylist/PropertyListFile.h"

namespace accounts {
namespace {

constexpr std::string_view kOperation = "read the property list";

std::optional<PropertyDictionary> dictionaryFromBytes(const std::optional<std::string>& bytes,
                                                      std::string_view path, PathError& error) {
  if (!bytes) {
    return std::nullopt;
  }
  PropertyListError malformed;
  const auto value = readPropertyList(*bytes, malformed);
  if (!value) {
    error = pathError(kOperation, path, malformed.text);
    return std::nullopt;
  }
  const PropertyDictionary* dictionary = value->asDictionary();
  if (dictionary == nullptr) {
    error = pathError(kOperation, path, "Its root is not a dictionary");
    return std::nullopt;
  }
  return *dictionary;
}

}  // namespace

std::optional<PropertyDictionary> readDictionaryFile(const DeviceRoot& root, std::string_view path,
                                                     PathError& error) {
  return dictionaryFromBytes(root.readFile(path, error), path, error);
}

std::optional<PropertyDictionary> readHostDictionaryFile(const std::string& path,
                                                         PathError& error) {
  return dictionaryFromBytes(readHostFile(path, error), path, error);
}

}  // namespace accounts
