#include "platform/linux/LinuxBundleResources.h"

#include "platform/linux/DictionaryFile.h"
#include "vocabulary/DevicePath.h"

namespace accounts {
namespace {

std::string fileName(std::string_view name) {
  return std::string(name) + ".plist";
}

}  // namespace

bool LinuxBundleResources::hasPropertyList(std::string_view name) {
  return files_.exists(fileName(name));
}

std::optional<PropertyDictionary> LinuxBundleResources::readPropertyList(std::string_view name) {
  const auto bytes = files_.read(fileName(name));
  return valueOrNone(bytes ? dictionaryFromBytes(*bytes, name) : bytes.error());
}

}  // namespace accounts
