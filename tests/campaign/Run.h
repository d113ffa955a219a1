#pragma once

#include <cstddef>
#include <functional>
#include <optional>
#include <string>
#include <vector>

#include "commandline/ExitStatus.h"
#include "tests/campaign/InProcessWorker.h"
#include "tests/campaign/Scenario.h"
#include "tests/campaign/SimulatedDisk.h"
#include "tests/campaign/SimulatedKernel.h"

namespace accounts {

/// How one process is run on a disk.
struct RunOptions {
  std::optional<Fault> fault = {};
  SimulatedKernel::Recording recording = SimulatedKernel::Recording::Off;
  /// Tells the runs on one disk apart: what they make up differs.
  unsigned number = 1;
  /// The allocation that fails, counted over the action alone.
  std::optional<std::size_t> failingAllocation = {};
  /// What becomes of a worker's result on its way.
  std::optional<Handover::Limit> handover = {};
  /// What another program does, and when.
  std::optional<Intrusion> intrusion = {};
  /// A lock that another process has for a while.
  std::optional<OtherLock> otherLock = {};
  /// Who runs the plug-in; none for the scenario's own.
  std::optional<Scenario::Host> host = {};
};

/// What came of a run.
struct Run {
  SimulatedDisk disk;
  /// Whether the action was a success: the plug-in gave true, or what it did in memory is on the
  /// device. A save gives nothing and counts as one.
  bool succeeded = false;
  /// How the host would end. Not of a bare plug-in.
  ExitStatus exitStatus = ExitStatus::Success;
  std::string error;
  std::vector<std::string> warnings;
  /// Whether the process ended with std::bad_alloc.
  bool ranOutOfMemory = false;
  /// The bytes of every account settings file that the run meant to write, in order.
  std::vector<std::string> settingsWritten;
  /// What the workers handed over.
  Handover handover;
  /// How many notifier classes were told of changes.
  std::size_t notifications = 0;
  /// The paths of the system calls that the fault made fail.
  std::vector<std::string> refusedPaths;
  std::size_t operations = 0;
  std::size_t allocations = 0;
  std::size_t openDescriptors = 0;
  /// With recording only.
  std::vector<SimulatedKernel::Call> calls;
  std::vector<DiskChange> changes;
};

/// Runs the action of a scenario, as one process, on a disk that need not be the scenario's own.
Run runOn(const SimulatedDisk& disk, const Scenario& scenario, const RunOptions& options);

}  // namespace accounts
