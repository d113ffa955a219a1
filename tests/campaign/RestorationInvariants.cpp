#include "tests/campaign/RestorationInvariants.h"

#include <algorithm>

#include "tests/campaign/SettingsContents.h"
#include "vocabulary/DevicePlaces.h"

namespace accounts {

namespace {

/// The contents of the files that the host keeps in whole folders and that stand at the places, but
/// for what a restoration is to end.
std::vector<std::string> safeContents(const SimulatedDisk& disk) {
  std::vector<std::string> contents;
  for (const std::string& path : disk.filesBeneath(kAccountMigrationDirectory)) {
    const bool isInWholeFolder =
        path.find("/Kept-") != std::string::npos || path.find("/Replaced-") != std::string::npos;
    if (isInWholeFolder && !path.ends_with("/List")) {
      contents.push_back(*disk.contentsOf(path));
    }
  }
  for (const ListedPlace& each : kDevicePlaces) {
    const auto standing = disk.contentsOf(pathOf(each.place));
    if (standing && each.place != DevicePlace::RemovalSentinel &&
        each.place != DevicePlace::CommitRecord) {
      contents.push_back(*standing);
    }
  }
  return contents;
}

}  // namespace

RestorationInvariants::RestorationInvariants(const Scenario& scenario)
    : scenario_(scenario),
      undisturbed_(runOn(scenario.disk, scenario, {.recording = SimulatedKernel::Recording::On})),
      contentsBefore_(safeContents(scenario.disk)) {}

Complaint RestorationInvariants::ofInterruption(
    const SimulatedDisk& disk, const std::vector<std::string>& /*settingsWritten*/) {
  const std::vector<std::string> safe = safeContents(disk);
  for (const std::string& contents : contentsBefore_) {
    if (std::ranges::find(safe, contents) == safe.end()) {
      return "a file is neither in its place nor kept";
    }
  }
  for (const std::string& contents : safe) {
    if (std::ranges::find(contentsBefore_, contents) == contentsBefore_.end()) {
      return "a file that was put back or kept is not whole";
    }
  }
  return std::nullopt;
}

Complaint RestorationInvariants::ofFaultedRun(const Run& run, const Fault& fault) {
  if (run.openDescriptors != 0) {
    return "a descriptor stayed open";
  }
  if (!run.succeeded && run.error.empty() && run.exitStatus != ExitStatus::CannotCreate) {
    return "the restoration failed without a word";
  }
  if (run.succeeded && fault.duration == Fault::Duration::Once) {
    if (const Complaint complaint = judgeNextRun(run.disk); complaint) {
      return complaint;
    }
  }
  return ofInterruption(run.disk, {});
}

Complaint RestorationInvariants::ofNextRun(const SimulatedDisk& disk) {
  const std::uint64_t fingerprint = disk.fingerprint();
  const auto known = nextRuns_.find(fingerprint);
  return known != nextRuns_.end()
             ? known->second
             : nextRuns_.emplace(fingerprint, judgeNextRun(disk)).first->second;
}

Complaint RestorationInvariants::judgeNextRun(const SimulatedDisk& disk) const {
  const Run run = runOn(disk, scenario_, {.number = 2});
  for (const ListedPlace& each : kDevicePlaces) {
    const std::string path = pathOf(each.place);
    if (each.place == DevicePlace::CopyAside) {
      // For engineers: where it cannot be told whether there is one, it is left alone.
      continue;
    }
    if (run.disk.contentsOf(path) != undisturbed_.disk.contentsOf(path)) {
      return "the next restoration does not bring back " + path;
    }
  }
  // When everything is back, there is nothing that another restoration would begin.
  return run.succeeded && !temporaryFiles(run.disk).empty()
             ? Complaint("the next restoration leaves a temporary file")
             : Complaint();
}

}  // namespace accounts
