#pragma once

#include <chrono>
#include <memory>
#include <optional>
#include <string>

#include "commandline/ExitStatus.h"
#include "host/PluginBundle.h"
#include "platform/linux/LinuxPlatform.h"

namespace accounts {

/// The device that a plug-in is to run on. Paths belong to the machine that the host runs on,
/// except those called device paths, which start at the root of the device.
struct DeviceOptions {
  std::string root;
  /// A device path; none for the platform's own.
  std::optional<std::string> home;
  /// None for the root's own description.
  std::optional<std::string> deviceDescription;
  /// None for the bundle of the program.
  std::optional<std::string> plugin;
  /// A device path; none for the one in the home directory.
  std::optional<std::string> temporaryDirectory;
  /// Where the log channel goes, "-" for standard error, "journal" for the system's journal;
  /// none keeps the channel off.
  std::optional<std::string> channel;
  /// How long another host on the root is waited for; none for as long as it takes.
  std::optional<std::chrono::seconds> lockTimeout;
};

/// A device with the plug-in that is to run on it.
struct OpenedDevice {
  PluginBundle bundle;
  std::unique_ptr<LinuxPlatform> platform;
};

/// Finds the bundle and makes the platform. That changes nothing beneath the root, and looks into
/// no file: whoever is to use the platform decodes the device description.
OrProgramError<OpenedDevice> openDevice(const DeviceOptions& options);

}  // namespace accounts
