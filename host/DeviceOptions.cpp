#include "host/DeviceOptions.h"

#include "commandline/PlatformError.h"

namespace accounts {

std::variant<OpenedDevice, ProgramError> openDevice(const DeviceOptions& options) {
  std::variant<PluginBundle, ProgramError> bundle = PluginBundle::find(options.plugin);
  if (const auto* error = std::get_if<ProgramError>(&bundle)) {
    return *error;
  }
  auto& found = std::get<PluginBundle>(bundle);
  LinuxPlatformOptions wanted;
  wanted.rootDirectory = options.root;
  wanted.homeDirectory = options.home.value_or(wanted.homeDirectory);
  wanted.temporaryDirectory = options.temporaryDirectory;
  wanted.bundleResourcesDirectory = found.resourcesDirectory().string();
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
  return OpenedDevice{std::move(found), std::move(platform)};
}

}  // namespace accounts
