#pragma once

#include <memory>
#include <optional>
#include <string>

#include "accountsettings/Process.h"
#include "commandline/ExitStatus.h"
#include "platform/linux/LinuxPlatform.h"

namespace accounts {

/// What the store's own code needs to run in this program: a device and its process.
class DevicePlatform {
 public:
  /// On the device of the options' root. Options without a directory of resources have that of the
  /// bundle of the program. Reads what it will need of the bundle and of this machine. An error
  /// when the root, the device description or the resources are missing or unreadable.
  static OrProgramError<std::unique_ptr<DevicePlatform>> open(LinuxPlatformOptions options);

  /// Decodes what was read, before any use. An error when that cannot be done.
  OrProgramError<void> decode();

  LinuxPlatform& linuxPlatform() { return *platform_; }

 private:
  DevicePlatform(std::unique_ptr<LinuxPlatform> platform, std::string resources);

  std::unique_ptr<LinuxPlatform> platform_;
  std::string resources_;
  Process process_;
};

}  // namespace accounts
