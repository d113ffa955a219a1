#include "platform/linux/DictionaryFile.h"

#include "platform/linux/PathFailure.h"
#include "propertylist/PropertyListFile.h"

namespace accounts {
namespace {

constexpr std::string_view kReadOperation = "read the property list";

}  // namespace

OrFailure<PropertyDictionary> dictionaryFromBytes(std::string_view bytes, std::string_view path) {
  const auto value = readPropertyList(bytes);
  if (!value) {
    return pathFailure(kReadOperation, path, value.error().text);
  }
  const PropertyDictionary* dictionary = value->asDictionary();
  if (dictionary == nullptr) {
    return pathFailure(kReadOperation, path, "Its root is not a dictionary");
  }
  return *dictionary;
}

}  // namespace accounts
