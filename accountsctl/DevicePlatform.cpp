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
  auto platform = LinuxPlatform::create(options);
  if (!platform) {
    return programErrorOf(platform.error());
  }
  if (const Result read = (*platform)->readAhead(); !read) {
    return programErrorOf(read.error(), ExitStatus::MissingInput);
  }
  return std::unique_ptr<DevicePlatform>(
      new DevicePlatform(*std::move(platform), options.bundleResourcesDirectory));
}

OrProgramError<void> DevicePlatform::decode() {
  if (const Result decoded = platform_->decodeDescription(); !decoded) {
    return programErrorOf(decoded.error(), ExitStatus::MissingInput);
  }
  for (const char* name : kNeededResources) {
    if (!platform_->platform().bundleResources.readPropertyList(name)) {
      return ProgramError{ExitStatus::MissingInput,
                          std::string("No readable resource ") + name + " in " + resources_};
    }
  }
  return {};
}

}  // namespace accounts
