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
  auto platform = LinuxPlatform::create(wanted);
  if (!platform) {
    return programErrorOf(platform.error());
  }
  if (const auto device = checkIsDevice((*platform)->root(), options.root); !device) {
    return device.error();
  }
  return OpenedDevice{*std::move(bundle), *std::move(platform)};
}

}  // namespace accounts
