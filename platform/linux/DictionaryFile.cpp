#include "platform/linux/DictionaryFile.h"

#include "platform/linux/PathFailure.h"
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

}  // namespace accounts
