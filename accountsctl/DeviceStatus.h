#pragma once

#include <cstdint>
#include <optional>
#include <string>
#include <vector>

#include "platform/DeviceSnapshot.h"
#include "platform/linux/LinuxPlatform.h"
#include "propertylist/value/PropertyValue.h"

namespace accounts {

/// What a migration would find on a device. Paths are device paths.
struct DeviceStatus {
  /// The account settings file; without a content when it is missing or unreadable.
  std::string settingsPath;
  bool hasSettings = false;
  /// Why the settings file that is there cannot be read.
  std::optional<std::string> settingsProblem;
  std::optional<PropertyValue> storedVersion;
  std::size_t accountCount = 0;

  /// What a migration would do.
  bool finishesRemoval = false;
  bool convertsMailAccounts = false;
  bool convertsExchangeAccounts = false;
  /// The version at which the upgrade chain is entered, with accounts that are converted too; none
  /// when it has nothing to do.
  std::optional<std::uint64_t> upgradesFromVersion;

  /// Folders in which a run kept its inputs.
  std::vector<std::string> keptFolders;
  /// Temporary files whose makers have ended.
  std::vector<std::string> abandonedFiles;

  /// Whether a migration has something to do, or an earlier one left its inputs for a person.
  [[nodiscard]] bool isPending() const {
    return finishesRemoval || convertsMailAccounts || convertsExchangeAccounts ||
           upgradesFromVersion || settingsProblem || !keptFolders.empty();
  }
};

/// What earlier runs left on a device. Changes nothing, and decodes nothing. An error when it
/// cannot be told which files are kept.
OrFailure<DeviceStatus> leftoversOn(LinuxPlatform& platform);

/// Completes that with what a snapshot of the device holds.
void lookAtDevice(LinuxPlatform& platform, const DeviceSnapshot& snapshot, DeviceStatus& status);

}  // namespace accounts
