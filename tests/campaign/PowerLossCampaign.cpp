#include <memory>
#include <string>
#include <unordered_set>

#include "tests/campaign/Campaigns.h"
#include "tests/campaign/PowerLoss.h"

namespace accounts {

namespace {

constexpr std::size_t kFewestLosses = 100'000;

/// So many times, at even distances, the first run is killed before the power fails in the second.
constexpr std::size_t kKills = 3;

class PowerlessScenario {
 public:
  PowerlessScenario(const Scenario& scenario, Report& report)
      : scenario_(scenario), report_(report), invariants_(Invariants::of(scenario)) {}

  void tryAll() {
    const Run& run = invariants_->undisturbed();
    tryRun("", run.changes, 0, run.settingsWritten);
    for (std::size_t kill = 1; kill <= kKills; ++kill) {
      trySecondRun(run.changes.size() * kill / (kKills + 1));
    }
    report_.add("distinct disks", known_.size());
  }

 private:
  /// The power fails after each change from a number on.
  void tryRun(const std::string& name, const std::vector<DiskChange>& changes, std::size_t from,
              const std::vector<std::string>& settingsWritten) {
    PowerLoss powerLoss(scenario_.disk, changes);
    for (std::size_t count = from; count <= changes.size(); ++count) {
      std::size_t number = 0;
      powerLoss.forEachDiskAfter(count, [&](const SimulatedDisk& disk) {
        if (report_.takes(scenario_.name, count, name + "state-" + std::to_string(number++)) &&
            known_.insert(disk.fingerprint()).second) {
          report_.judge(judge(disk, settingsWritten), "change " + std::to_string(count));
        }
      });
    }
  }

  /// What a killed run did is not on the medium either when the power fails in the next one.
  void trySecondRun(std::size_t killedAfter) {
    const Run& first = invariants_->undisturbed();
    std::vector<DiskChange> changes(
        first.changes.begin(), first.changes.begin() + static_cast<std::ptrdiff_t>(killedAfter));
    SimulatedDisk left = scenario_.disk;
    for (const DiskChange& change : changes) {
      left.apply(change);
    }
    const Run second =
        runOn(left, scenario_, {.recording = SimulatedKernel::Recording::On, .number = kSecondRun});
    changes.insert(changes.end(), second.changes.begin(), second.changes.end());
    std::vector<std::string> settingsWritten = first.settingsWritten;
    settingsWritten.insert(settingsWritten.end(), second.settingsWritten.begin(),
                           second.settingsWritten.end());
    tryRun("killed-after-" + std::to_string(killedAfter) + "-", changes, killedAfter,
           settingsWritten);
  }

  Complaint judge(const SimulatedDisk& disk, const std::vector<std::string>& settingsWritten) {
    const Complaint complaint = invariants_->ofInterruption(disk, settingsWritten);
    return complaint ? complaint : invariants_->ofNextRun(disk);
  }

  static constexpr unsigned kSecondRun = 4;
  const Scenario& scenario_;
  Report& report_;
  std::unique_ptr<Invariants> invariants_;
  std::unordered_set<std::uint64_t> known_;
};

}  // namespace

bool runPowerLossCampaign(const std::vector<Scenario>& scenarios, const Selection& selection) {
  Report report(selection);
  for (const Scenario& scenario : scenarios) {
    if (report.takes(scenario.name)) {
      PowerlessScenario(scenario, report).tryAll();
    }
  }
  return report.finish("power-loss", kFewestLosses);
}

}  // namespace accounts
