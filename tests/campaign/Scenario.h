#pragma once

#include <cstdint>
#include <string>
#include <vector>

#include "platform/linux/DeviceDescription.h"
#include "safetynet/MigrationInMemory.h"
#include "tests/campaign/SimulatedDisk.h"
#include "tests/campaign/SimulatedKernel.h"

namespace accounts {

/// A device, and what is done on it while everything goes wrong.
struct Scenario {
  enum class Action : std::uint8_t {
    Migration,
    /// A program of the device adds an account outside a migration and saves; notifiers are told.
    SaveOutsideMigration,
    /// Kept files are put back.
    Restoration,
  };
  /// Who runs the plug-in.
  enum class Host : std::uint8_t {
    /// Nobody: it is alone on the device.
    Bare,
    /// A run that is one transaction.
    Transaction
  };
  std::string name;
  SimulatedDisk disk;
  DeviceDescription description = {};
  Action action = Action::Migration;
  Host host = Host::Bare;
  KeepFiles keep = KeepFiles::WhenNeeded;
  FileSystemAbilities abilities = {};
};

/// All scenarios of a host, in a fixed order. Names are unique.
std::vector<Scenario> allScenarios(Scenario::Host host);

}  // namespace accounts
