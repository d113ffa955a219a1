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
  Failure error;
  const std::optional<std::string> bytes = files_.read(fileName(name), error);
  return bytes ? dictionaryFromBytes(*bytes, name, error) : std::nullopt;
}

}  // namespace accounts
