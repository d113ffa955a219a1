#pragma once

#include <cstddef>
#include <cstdint>
#include <optional>
#include <set>
#include <string>
#include <unordered_map>
#include <vector>

#include "propertylist/PropertyValue.h"
#include "tests/campaign/Run.h"
#include "tests/campaign/Scenario.h"

namespace accounts {

/// What is wrong with a case, in words; none when all is well.
using Complaint = std::optional<std::string>;

/// What holds on the device of one scenario, whatever goes wrong on it. An account counts as kept
/// by its identifier; those meant are the ones that the undisturbed run keeps.
class Invariants {
 public:
  explicit Invariants(const Scenario& scenario);

  /// The run in which nothing goes wrong, recorded.
  [[nodiscard]] const Run& undisturbed() const { return undisturbed_; }

  /// Judges a run that came to its end in spite of a fault.
  Complaint ofFaultedRun(const Run& run, const Fault& fault);

  /// Judges what a run left that was interrupted at any point: killed, or by a loss of power.
  /// `settingsWritten` are the files that it meant to write.
  Complaint ofInterruption(const SimulatedDisk& disk,
                           const std::vector<std::string>& settingsWritten);

  /// Runs the action again on what is left, with nothing going wrong, and judges its end. The same
  /// disk is judged once.
  Complaint ofNextRun(const SimulatedDisk& disk);

  /// How many different disks a next run was made on.
  [[nodiscard]] std::size_t distinctDisks() const { return nextRuns_.size(); }
  /// How often a legacy store was removed although its accounts had not been carried over, which
  /// happens only where the rules have it so: it could not be read, or the last save failed.
  [[nodiscard]] std::size_t removalsWithoutSave() const { return removalsWithoutSave_; }

 private:
  struct LegacyStore {
    std::string path;
    std::string contents;
    /// The identifiers of its accounts that the undisturbed run keeps.
    std::set<std::string> identifiers;
  };

  [[nodiscard]] Complaint ofSettings(const SimulatedDisk& disk,
                                     const std::vector<std::string>& settingsWritten) const;
  /// A legacy store that is gone although accounts of it are not in the settings file, if any.
  [[nodiscard]] const LegacyStore* lostStore(const SimulatedDisk& disk);
  [[nodiscard]] bool isUntouched(const SimulatedDisk& disk) const;
  Complaint judgeNextRun(const SimulatedDisk& disk);
  Complaint judgeNextRestoration(const SimulatedDisk& disk) const;
  /// Whether the host's kept files are whole, and hold what a restoration has not put back yet.
  [[nodiscard]] Complaint ofKeptFiles(const SimulatedDisk& disk,
                                      const std::vector<std::string>& settingsWritten) const;
  [[nodiscard]] PropertyValue named(const std::string& settingsBytes) const;
  /// The identifiers of the accounts in a settings file's bytes, children included.
  const std::set<std::string>& identifiersIn(const std::string& settingsBytes);

  const Scenario& scenario_;
  Run undisturbed_;
  std::set<std::string> textsBefore_;
  std::optional<std::string> settingsBefore_;
  /// What files kept by an earlier run hold.
  std::vector<std::string> keptBefore_;
  std::vector<LegacyStore> legacyStores_;
  std::set<std::string> keptIdentifiers_;
  std::optional<PropertyValue> end_;
  std::unordered_map<std::uint64_t, Complaint> nextRuns_;
  std::unordered_map<std::string, std::set<std::string>> identifiers_;
  std::size_t removalsWithoutSave_ = 0;
};

}  // namespace accounts
