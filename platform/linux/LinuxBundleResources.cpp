#include "platform/linux/LinuxBundleResources.h"

#include <unistd.h>

#include <utility>

#include "platform/linux/DictionaryFile.h"
#include "vocabulary/DevicePath.h"

namespace accounts {
namespace {

std::string resourcePath(std::string_view directory, std::string_view name) {
  return joinedPath(directory, name) + ".plist";
}

}  // namespace

LinuxBundleResources::LinuxBundleResources(std::string resourcesDirectory)
    : resourcesDirectory_(std::move(resourcesDirectory)) {}

bool LinuxBundleResources::hasPropertyList(std::string_view name) {
  return ::access(resourcePath(resourcesDirectory_, name).c_str(), F_OK) == 0;
}

std::optional<PropertyDictionary> LinuxBundleResources::readPropertyList(std::string_view name) {
  PathError error;
  return readHostDictionaryFile(resourcePath(resourcesDirectory_, name), error, Pipes::Refuse);
}

}  // namespace accounts
