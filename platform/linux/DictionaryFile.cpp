#include "platform/linux/DictionaryFile.h"

#include "platform/linux/PathFailure.h"
#include "propertylist/PropertyListFile.h"

namespace accounts {
namespace {

constexpr std::string_view kReadOperation = "read the property list";

}  // namespace

OrFailure<PropertyDictionary> dictionaryFromBytes(std::string_view bytes, std::string_view path) {
  PropertyListError malformed;
  const auto value = readPropertyList(bytes, malformed);
  if (!value) {
    return pathFailure(kReadOperation, path, malformed.text);
  }
  const PropertyDictionary* dictionary = value->asDictionary();
  if (dictionary == nullptr) {
    return pathFailure(kReadOperation, path, "Its root is not a dictionary");
  }
  return *dictionary;
}

}  // namespace accounts
