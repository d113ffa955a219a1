#pragma once

#include <cstddef>
#include <memory>
#include <optional>
#include <string>
#include <vector>

#include "tests/campaign/Run.h"
#include "tests/campaign/Scenario.h"

namespace accounts {

/// What is wrong with a case, in words; none when all is well.
using Complaint = std::optional<std::string>;

/// What holds on the device of one scenario, whatever goes wrong on it.
class Invariants {
 public:
  /// Those of a scenario's host and action. The scenario must outlive them.
  static std::unique_ptr<Invariants> of(const Scenario& scenario);
  virtual ~Invariants() = default;

  /// The run in which nothing goes wrong, recorded.
  [[nodiscard]] virtual const Run& undisturbed() const = 0;

  /// Judges a run that came to its end in spite of a fault.
  virtual Complaint ofFaultedRun(const Run& run, const Fault& fault) = 0;

  /// Judges what a run left that was interrupted at any point: killed, or by a loss of power.
  /// `settingsWritten` are the settings files that it meant to write, or one before it.
  virtual Complaint ofInterruption(const SimulatedDisk& disk,
                                   const std::vector<std::string>& settingsWritten) = 0;

  /// Runs the action again on what is left, with nothing going wrong, and judges its end. The same
  /// disk is judged once.
  virtual Complaint ofNextRun(const SimulatedDisk& disk) = 0;

  /// How many different disks a next run was made on.
  [[nodiscard]] virtual std::size_t distinctDisks() const = 0;
  /// How often a legacy store was removed although its accounts had not been carried over, which
  /// happens only where the rules of a bare plug-in have it so: it could not be read, or the last
  /// save failed.
  [[nodiscard]] virtual std::size_t removalsWithoutSave() const { return 0; }
};

}  // namespace accounts
