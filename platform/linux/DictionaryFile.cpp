#include "platform/linux/DictionaryFile.h"

#include "platform/linux/FileContents.h"
#include "propertylist/PropertyListFile.h"

namespace accounts {
namespace {

constexpr std::string_view kReadOperation = "read the property list";

}  // namespace

std::optional<PropertyDictionary> dictionaryFromBytes(std::string_view bytes, std::string_view path,
                                                      Failure& error) {
  PropertyListError malformed;
  const auto value = readPropertyList(bytes, malformed);
  if (!value) {
    error = pathFailure(kReadOperation, path, malformed.text);
    return std::nullopt;
  }
  const PropertyDictionary* dictionary = value->asDictionary();
  if (dictionary == nullptr) {
    error = pathFailure(kReadOperation, path, "Its root is not a dictionary");
    return std::nullopt;
  }
  return *dictionary;
}

std::optional<PropertyDictionary> readDictionaryFile(const DeviceRoot& root, std::string_view path,
                                                     Failure& error) {
  const std::optional<std::string> bytes = root.readFile(path, error);
  return bytes ? dictionaryFromBytes(*bytes, path, error) : std::nullopt;
}

std::optional<PropertyDictionary> readHostDictionaryFile(const std::string& path, Failure& error,
                                                         Pipes pipes) {
  const std::optional<std::string> bytes = readHostFile(path, error, pipes);
  return bytes ? dictionaryFromBytes(*bytes, nameOfInput(path), error) : std::nullopt;
}

}  // namespace accounts
