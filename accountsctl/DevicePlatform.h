#pragma once

#include <memory>
#include <optional>
#include <string>
#include <variant>

#include "accountsettings/Process.h"
#include "commandline/ExitStatus.h"
#include "platform/linux/LinuxPlatform.h"

namespace accounts {

/// What the store's own code needs to run in this program: a device and its process.
class DevicePlatform {
 public:
  /// On the device of the options' root. Options without a directory of resources have that of the
  /// bundle of the program. An error when the root, the device description or the resources are
  /// missing or unreadable.
  static std::variant<std::unique_ptr<DevicePlatform>, ProgramError> make(
      LinuxPlatformOptions options);

  LinuxPlatform& linuxPlatform() { return *platform_; }

 private:
  explicit DevicePlatform(std::unique_ptr<LinuxPlatform> platform);

  std::unique_ptr<LinuxPlatform> platform_;
  Process process_;
};

}  // namespace accounts
