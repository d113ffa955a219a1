#pragma once

#include <cstdint>
#include <set>
#include <string>
#include <unordered_map>
#include <vector>

#include "propertylist/value/PropertyValue.h"
#include "tests/campaign/Invariants.h"

namespace accounts {

/// What holds of a plug-in that is alone on the device. An account counts as kept by its
/// identifier; those meant are the ones that the undisturbed run keeps.
class BareInvariants final : public Invariants {
 public:
  explicit BareInvariants(const Scenario& scenario);

  [[nodiscard]] const Run& undisturbed() const override { return undisturbed_; }
  Complaint ofFaultedRun(const Run& run, const Fault& fault) override;
  Complaint ofInterruption(const SimulatedDisk& disk,
                           const std::vector<std::string>& settingsWritten) override;
  Complaint ofNextRun(const SimulatedDisk& disk) override;
  [[nodiscard]] std::size_t distinctDisks() const override { return nextRuns_.size(); }
  [[nodiscard]] std::size_t removalsWithoutSave() const override { return removalsWithoutSave_; }

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
  [[nodiscard]] PropertyValue named(const std::string& settingsBytes) const;
  /// The identifiers of the accounts in a settings file's bytes, children included.
  const std::set<std::string>& identifiersIn(const std::string& settingsBytes);

  const Scenario& scenario_;
  Run undisturbed_;
  std::set<std::string> textsBefore_;
  std::optional<std::string> settingsBefore_;
  std::vector<LegacyStore> legacyStores_;
  std::set<std::string> keptIdentifiers_;
  std::optional<PropertyValue> end_;
  std::unordered_map<std::uint64_t, Complaint> nextRuns_;
  std::unordered_map<std::string, std::set<std::string>> identifiers_;
  std::size_t removalsWithoutSave_ = 0;
};

}  // namespace accounts
