#pragma once

#include <optional>
#include <set>
#include <string>

#include "commandline/ExitStatus.h"
#include "propertylist/value/PropertyValue.h"
#include "tests/campaign/SimulatedDisk.h"
#include "vocabulary/DevicePlaces.h"

namespace accounts {

/// How a device ends: what its settings file holds, with names for the identifiers that a migration
/// makes up, and at which of the other places of a migration something stands.
struct Ending {
  std::optional<PropertyValue> settings;
  /// What it holds after another run. Where accounts were merged, that run can change it again.
  std::optional<PropertyValue> settingsLater;
  std::set<DevicePlace> places;
  ExitStatus exitStatus = ExitStatus::Success;
};

/// How a device ends. `textsBefore` are the texts that no migration has made up.
Ending endingOf(const SimulatedDisk& disk, ExitStatus exitStatus,
                const std::set<std::string>& textsBefore);

/// How one ending differs from another, in words; none when it does not.
std::optional<std::string> differenceOf(const Ending& expected, const Ending& found);

}  // namespace accounts
