#pragma once

#include <cstdint>
#include <map>
#include <set>
#include <string>
#include <utility>
#include <vector>

#include "tests/campaign/Ending.h"
#include "tests/campaign/Invariants.h"

namespace accounts {

/// What holds of a run that is one transaction: at every moment the device is as it was, or
/// migrated, or migrated with a record with which the next run finishes it; the next run ends as an
/// undisturbed one does; and nothing but the places of a migration is touched.
class TransactionInvariants final : public Invariants {
 public:
  explicit TransactionInvariants(const Scenario& scenario);

  [[nodiscard]] const Run& undisturbed() const override { return undisturbed_; }
  Complaint ofFaultedRun(const Run& run, const Fault& fault) override;
  Complaint ofInterruption(const SimulatedDisk& disk,
                           const std::vector<std::string>& settingsWritten) override;
  Complaint ofNextRun(const SimulatedDisk& disk) override { return ofNextRun(disk, ending_); }
  [[nodiscard]] std::size_t distinctDisks() const override { return nextRuns_.size(); }

  /// Judges a run by a device that is as it was, but for what a host leaves for its successor.
  [[nodiscard]] Complaint ofUnchanged(const SimulatedDisk& disk) const;

  /// The same as ofNextRun for a device on which somebody did something meanwhile. `expected` must
  /// stay the same object for the same ending.
  Complaint ofNextRun(const SimulatedDisk& disk, const Ending& expected);
  /// How a device ends after an undisturbed run on a disk.
  [[nodiscard]] Ending endingAfterRun(const SimulatedDisk& disk) const;
  [[nodiscard]] Ending endingOf(const SimulatedDisk& disk, ExitStatus exitStatus) const {
    return accounts::endingOf(disk, exitStatus, textsBefore_);
  }
  [[nodiscard]] const Ending& ending() const { return ending_; }
  /// Whether the settings file is the very one that was there before.
  [[nodiscard]] bool hasOldSettings(const SimulatedDisk& disk) const;

 private:
  [[nodiscard]] Complaint ofOtherFiles(const SimulatedDisk& disk) const;
  [[nodiscard]] Complaint ofKeptFolders(const SimulatedDisk& disk, bool isMigrated) const;
  [[nodiscard]] Complaint ofStores(const SimulatedDisk& disk, bool isMigrated) const;
  [[nodiscard]] Complaint ofBestEffort(const SimulatedDisk& disk) const;
  /// Whether a run that failed says so with a status that faults have, and with a reason.
  [[nodiscard]] bool isFitting(const Run& run) const;
  Complaint judgeNextRun(const SimulatedDisk& disk, const Ending& expected) const;

  const Scenario& scenario_;
  Run undisturbed_;
  std::set<std::string> textsBefore_;
  /// Whether the undisturbed run puts a settings file in place.
  bool writesSettings_ = false;
  Ending ending_;
  std::map<std::pair<std::uint64_t, const Ending*>, Complaint> nextRuns_;
};

}  // namespace accounts
