#pragma once

#include <map>
#include <string>
#include <vector>

#include "tests/program/DeviceRootFixture.h"
#include "tests/program/ExitStatuses.h"
#include "tests/program/HostileKind.h"
#include "tests/program/OutsideTree.h"

namespace accounts {

/// A device that a migration changes in every way (both legacy stores, old settings, an information
/// file asked for), a hostile thing in one of its places, and a tree outside that must stay as it
/// is.
class HostileRootFixture : public DeviceRootFixture {
 protected:
  HostileRootFixture();
  ~HostileRootFixture() override;

  /// Puts something hostile in a place of the device, for SetUp(). Skips the test where the system
  /// cannot.
  void put(const HostileKind& kind, const char* devicePath);

  /// Migrates with JSON and the log channel, by the user to whom the kind is hostile.
  ProgramResult migrateWith(const HostileKind& kind, std::vector<std::string> arguments);

  /// Expects that the tree outside is as it was before put(), to the time of last access, and that
  /// no file of the root holds anything from there.
  void expectNothingCrossedTheBorder() const;

  const OutsideTree outside_;

 private:
  std::map<std::string, std::string> outsideBefore_;
  std::vector<std::filesystem::path> immutable_;
};

/// Expects what a person and a program may rely on whatever a run meets: every line of standard
/// error is one line without control characters, the host's own is there exactly once in a run of
/// a status that needs a reason, and standard output is one object with this status.
void expectClearReport(const ProgramResult& result);

}  // namespace accounts
