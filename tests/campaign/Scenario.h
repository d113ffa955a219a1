#pragma once

#include <cstdint>
#include <string>
#include <vector>

#include "platform/linux/DeviceDescription.h"
#include "tests/campaign/SimulatedDisk.h"
#include "tests/fakes/FakePlatform.h"

namespace accounts {

/// A device, and what is done on it while everything goes wrong.
struct Scenario {
  enum class Action : std::uint8_t {
    Migration,
    /// A program of the device adds an account outside a migration and saves; notifiers are told.
    SaveOutsideMigration,
  };
  std::string name;
  SimulatedDisk disk;
  DeviceDescription description = {};
  Action action = Action::Migration;
};

/// All scenarios, in a fixed order. Names are unique.
std::vector<Scenario> allScenarios();

}  // namespace accounts
