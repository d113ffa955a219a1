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

DevicePlatform::DevicePlatform(std::unique_ptr<LinuxPlatform> platform, std::string resources)
    : platform_(std::move(platform)),
      resources_(std::move(resources)),
      process_(platform_->platform()) {}

OrProgramError<std::unique_ptr<DevicePlatform>> DevicePlatform::open(LinuxPlatformOptions options) {
  if (options.bundleResourcesDirectory.empty()) {
    options.bundleResourcesDirectory = resourcesOfBundle(bundleOfProgram()).string();
  }
  options.descriptionDecoding = DescriptionDecoding::Later;
  LinuxPlatformError error;
  std::unique_ptr<LinuxPlatform> platform = LinuxPlatform::create(options, error);
  if (platform == nullptr) {
    return programErrorOf(error);
  }
  if (const Result read = platform->readAhead(); !read) {
    return programErrorOf(read.error(), ExitStatus::MissingInput);
  }
  return std::unique_ptr<DevicePlatform>(
      new DevicePlatform(std::move(platform), options.bundleResourcesDirectory));
}

std::optional<ProgramError> DevicePlatform::decode() {
  if (LinuxPlatformError error; !platform_->decodeDescription(error)) {
    return programErrorOf(error);
  }
  for (const char* name : kNeededResources) {
    if (!platform_->platform().bundleResources.readPropertyList(name)) {
      return ProgramError{ExitStatus::MissingInput,
                          std::string("No readable resource ") + name + " in " + resources_};
    }
  }
  return std::nullopt;
}

}  // namespace accounts
