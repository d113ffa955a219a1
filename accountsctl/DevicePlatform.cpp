#include "accountsctl/DevicePlatform.h"

#include <utility>

#include "commandline/BundleLocation.h"
#include "commandline/PlatformError.h"

namespace accounts {
namespace {

/// Without these the store's code cannot work, and says so by ending the process.
constexpr const char* kNeededResources[] = {"AccountTypesProperties", "DataclassesProperties",
                                            "MailServices"};

}  // namespace

DevicePlatform::DevicePlatform(std::unique_ptr<LinuxPlatform> platform)
    : platform_(std::move(platform)), process_(platform_->platform()) {}

std::variant<std::unique_ptr<DevicePlatform>, ProgramError> DevicePlatform::make(
    LinuxPlatformOptions options) {
  if (options.bundleResourcesDirectory.empty()) {
    options.bundleResourcesDirectory = resourcesOfBundle(bundleOfProgram()).string();
  }
  LinuxPlatformError error;
  std::unique_ptr<LinuxPlatform> platform = LinuxPlatform::create(options, error);
  if (platform == nullptr) {
    return programErrorOf(error);
  }
  for (const char* name : kNeededResources) {
    if (!platform->platform().bundleResources.readPropertyList(name)) {
      return ProgramError{ExitStatus::MissingInput, std::string("No readable resource ") + name +
                                                        " in " + options.bundleResourcesDirectory};
    }
  }
  return std::unique_ptr<DevicePlatform>(new DevicePlatform(std::move(platform)));
}

}  // namespace accounts
