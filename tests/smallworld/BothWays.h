#pragma once

#include <map>
#include <string>
#include <vector>

#include "safetynet/AccountLedger.h"
#include "safetynet/MigrationRun.h"
#include "safetynet/Proposal.h"
#include "tests/smallworld/SmallDevice.h"

namespace accounts {

/// The files of a device by path.
using Files = std::map<std::string, std::string>;

/// What the plug-in said to others, in order.
struct Told {
  /// Each with its source line.
  std::vector<std::string> channel;
  std::vector<std::string> console;
  /// Broadcasts and announcements.
  std::vector<std::string> announcements;
  bool operator==(const Told&) const = default;
};

/// What came of the plug-in alone on a device.
struct EndingAlone {
  bool succeeded = false;
  Files files;
  Told told;
};

/// What came of a run or of a plan.
struct EndingOfRun {
  RunConclusion conclusion;
  /// Without what the host keeps for itself.
  Files files;
  Told told;
  Proposal proposal;
  /// What the proposal puts in place.
  std::string memoryFile;
  AccountLedger ledger;
  /// Where the accounts of the result come from, as the plug-in says; empty when it saved none.
  std::vector<AccountOrigin> origins;
};

/// The files that a small device has before anything happens to it.
Files filesOf(const SmallDevice& device);

// A device with the services of a small one and these files; `turn` is how many times it was
// migrated before, and decides which identifiers are made up.

/// Lets the plug-in migrate it, as `--bare` does.
EndingAlone migratedAlone(const SmallDevice& device, const Files& files, unsigned turn);
/// Lets it migrate in memory and commits what came of that.
EndingOfRun migrated(const SmallDevice& device, const Files& files, unsigned turn,
                     RunPurpose purpose);

}  // namespace accounts
