#include <memory>
#include <string>

#include "tests/campaign/Campaigns.h"
#include "tests/campaign/KilledDisks.h"

namespace accounts {

namespace {

constexpr std::size_t kFewestKills = 10'000;

class KilledScenario {
 public:
  KilledScenario(const Scenario& scenario, Report& report)
      : scenario_(scenario), report_(report), invariants_(Invariants::of(scenario)) {}

  void tryAll() {
    const Run& run = invariants_->undisturbed();
    const std::vector<SimulatedDisk> disks = disksOf(scenario_.disk, run);
    std::optional<std::uint64_t> previous;
    for (std::size_t operation = 0; operation < run.calls.size(); ++operation) {
      for (const bool isAfter : {false, true}) {
        const SimulatedDisk& disk = disks[operation + (isAfter ? 1 : 0)];
        if (report_.takes(scenario_.name, operation, isAfter ? "kill-after" : "kill-before")) {
          report_.judge(judge(disk, run.settingsWritten), run.calls[operation].line);
        }
        // The second run is the same on the same disk: it is killed once for each.
        const std::uint64_t fingerprint = disk.fingerprint();
        if (fingerprint != previous) {
          killSecondRun(disk, operation, run);
        }
        previous = fingerprint;
      }
    }
    report_.add("distinct disks", invariants_->distinctDisks());
  }

 private:
  Complaint judge(const SimulatedDisk& disk, const std::vector<std::string>& settingsWritten) {
    const Complaint complaint = invariants_->ofInterruption(disk, settingsWritten);
    return complaint ? complaint : invariants_->ofNextRun(disk);
  }

  void killSecondRun(const SimulatedDisk& left, std::size_t firstOperation, const Run& first) {
    const std::string fault = "second-kill-after-" + std::to_string(firstOperation);
    if (!report_.mayTake(scenario_.name, fault)) {
      return;
    }
    const Run second =
        runOn(left, scenario_, {.recording = SimulatedKernel::Recording::On, .number = kSecondRun});
    std::vector<std::string> settingsWritten = first.settingsWritten;
    settingsWritten.insert(settingsWritten.end(), second.settingsWritten.begin(),
                           second.settingsWritten.end());
    const std::vector<SimulatedDisk> disks = disksOf(left, second);
    for (std::size_t operation = 0; operation < second.calls.size(); ++operation) {
      if (report_.takes(scenario_.name, operation, fault)) {
        report_.judge(judge(disks[operation + 1], settingsWritten), second.calls[operation].line);
      }
    }
  }

  static constexpr unsigned kSecondRun = 4;
  const Scenario& scenario_;
  Report& report_;
  std::unique_ptr<Invariants> invariants_;
};

}  // namespace

bool runKillCampaign(const std::vector<Scenario>& scenarios, const Selection& selection) {
  Report report(selection);
  for (const Scenario& scenario : scenarios) {
    if (report.takes(scenario.name)) {
      KilledScenario(scenario, report).tryAll();
    }
  }
  return report.finish("kills", kFewestKills);
}

}  // namespace accounts
