#include "host/DeviceOptions.h"

#include "commandline/PlatformError.h"

namespace accounts {

OrProgramError<OpenedDevice> openDevice(const DeviceOptions& options) {
  auto bundle = PluginBundle::find(options.plugin);
  if (!bundle) {
    return bundle.error();
  }
  LinuxPlatformOptions wanted;
  wanted.rootDirectory = options.root;
  wanted.homeDirectory = options.home.value_or(wanted.homeDirectory);
  wanted.temporaryDirectory = options.temporaryDirectory;
  wanted.bundleResourcesDirectory = bundle->resourcesDirectory().string();
  wanted.deviceDescriptionFile = options.deviceDescription;
  wanted.channel = options.channel;
  wanted.descriptionDecoding = DescriptionDecoding::Later;
  LinuxPlatformError error;
  std::unique_ptr<LinuxPlatform> platform = LinuxPlatform::create(wanted, error);
  if (platform == nullptr) {
    return programErrorOf(error);
  }
  if (const auto missing = whyNoDevice(platform->root(), options.root)) {
    return *missing;
  }
  return OpenedDevice{*std::move(bundle), std::move(platform)};
}

}  // namespace accounts
