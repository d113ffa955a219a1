#pragma once

#include <cstdint>
#include <map>
#include <string>
#include <vector>

#include "tests/campaign/Invariants.h"

namespace accounts {

/// What holds while kept files are put back: whatever was kept is kept or back, what they replace
/// is in its place or kept, and the next restoration brings back what is still missing.
class RestorationInvariants final : public Invariants {
 public:
  explicit RestorationInvariants(const Scenario& scenario);

  [[nodiscard]] const Run& undisturbed() const override { return undisturbed_; }
  Complaint ofFaultedRun(const Run& run, const Fault& fault) override;
  Complaint ofInterruption(const SimulatedDisk& disk,
                           const std::vector<std::string>& settingsWritten) override;
  Complaint ofNextRun(const SimulatedDisk& disk) override;
  [[nodiscard]] std::size_t distinctDisks() const override { return nextRuns_.size(); }

 private:
  [[nodiscard]] Complaint judgeNextRun(const SimulatedDisk& disk) const;

  const Scenario& scenario_;
  Run undisturbed_;
  /// The contents of all files that were kept or stood at a place.
  std::vector<std::string> contentsBefore_;
  std::map<std::uint64_t, Complaint> nextRuns_;
};

}  // namespace accounts
