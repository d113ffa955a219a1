#include <string>

#include "tests/campaign/Campaigns.h"
#include "tests/campaign/TransactionInvariants.h"

namespace accounts {

namespace {

constexpr std::size_t kFewestHandovers = 50'000;

struct NamedCut {
  std::string_view name;
  Handover::Cut cut;
};
constexpr NamedCut kCuts[] = {{"worker-ends", Handover::Cut::WorkerEnds},
                              {"list-is-short", Handover::Cut::ListIsShort},
                              {"memory-file-is-short", Handover::Cut::MemoryFileIsShort}};

/// How many bytes there are to be cut; with all of them nothing is amiss.
std::size_t bytesOf(const Handover& whole, Handover::Cut cut) {
  switch (cut) {
    case Handover::Cut::WorkerEnds:
      return whole.memoryFileSize + whole.frameSize;
    case Handover::Cut::ListIsShort:
      return whole.listSize;
    case Handover::Cut::MemoryFileIsShort:
      break;
  }
  return whole.memoryFileSize;
}

Complaint judge(const Run& run, bool isWhole, const Run& undisturbed,
                const TransactionInvariants& invariants) {
  if (run.openDescriptors != 0) {
    return "a descriptor stayed open";
  }
  if (isWhole) {
    return run.exitStatus == undisturbed.exitStatus &&
                   run.disk.fingerprint() == undisturbed.disk.fingerprint()
               ? Complaint()
               : "what was handed over whole ends differently";
  }
  if (run.exitStatus != ExitStatus::PluginEnded || run.error.empty()) {
    return "the run ends with exit status " + std::to_string(static_cast<int>(run.exitStatus)) +
           ": " + run.error;
  }
  return invariants.ofUnchanged(run.disk);
}

void tryHandoversIn(const Scenario& scenario, Report& report) {
  const TransactionInvariants invariants(scenario);
  const Run& undisturbed = invariants.undisturbed();
  for (const auto& [name, cut] : kCuts) {
    const std::size_t whole = bytesOf(undisturbed.handover, cut);
    for (std::size_t bytes = 0; bytes <= whole; ++bytes) {
      if (report.takes(scenario.name, bytes, name)) {
        const Run run = runOn(scenario.disk, scenario, {.handover = Handover::Limit{cut, bytes}});
        report.judge(judge(run, bytes == whole, undisturbed, invariants),
                     "byte " + std::to_string(bytes) + " of " + std::to_string(whole));
      }
    }
  }
  report.add("bytes handed over",
             undisturbed.handover.memoryFileSize + undisturbed.handover.frameSize);
}

}  // namespace

bool runHandoverCampaign(const std::vector<Scenario>& scenarios, const Selection& selection) {
  Report report(selection);
  for (const Scenario& scenario : scenarios) {
    if (report.takes(scenario.name) && scenario.host == Scenario::Host::Transaction &&
        scenario.action == Scenario::Action::Migration) {
      tryHandoversIn(scenario, report);
    }
  }
  return report.finish("handover", kFewestHandovers);
}

}  // namespace accounts
