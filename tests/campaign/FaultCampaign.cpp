#include <array>
#include <cerrno>
#include <memory>
#include <string>

#include "tests/campaign/Campaigns.h"

namespace accounts {

namespace {

constexpr std::size_t kFewestFaults = 100'000;

struct NamedFault {
  std::string_view name;
  int error;
  Fault::Duration duration;
};

constexpr auto kOnce = Fault::Duration::Once;
constexpr auto kFromThenOn = Fault::Duration::FromThenOn;

constexpr NamedFault kFaults[] = {
    {"EIO-once", EIO, kOnce},
    {"EIO-from-then-on", EIO, kFromThenOn},
    {"ENOSPC-once", ENOSPC, kOnce},
    {"ENOSPC-from-then-on", ENOSPC, kFromThenOn},
    {"EDQUOT-once", EDQUOT, kOnce},
    {"EDQUOT-from-then-on", EDQUOT, kFromThenOn},
    {"EACCES-once", EACCES, kOnce},
    {"EACCES-from-then-on", EACCES, kFromThenOn},
    {"EPERM-from-then-on", EPERM, kFromThenOn},
    {"EROFS-once", EROFS, kOnce},
    {"EROFS-from-then-on", EROFS, kFromThenOn},
    {"EMFILE-once", EMFILE, kOnce},
    {"EMFILE-from-then-on", EMFILE, kFromThenOn},
    {"ENFILE-once", ENFILE, kOnce},
    {"ENFILE-from-then-on", ENFILE, kFromThenOn},
    {"ENOMEM-once", ENOMEM, kOnce},
    {"ENOMEM-from-then-on", ENOMEM, kFromThenOn},
    {"ESTALE-once", ESTALE, kOnce},
    {"ESTALE-from-then-on", ESTALE, kFromThenOn},
    {"EINTR-once", EINTR, kOnce},
    {"EINVAL-once", EINVAL, kOnce},
    {"EINVAL-from-then-on", EINVAL, kFromThenOn},
    {"short-write-once", 0, kOnce},
    {"short-write-from-then-on", 0, kFromThenOn},
};

void tryFaultsIn(const Scenario& scenario, Report& report) {
  const std::unique_ptr<Invariants> invariants = Invariants::of(scenario);
  const std::vector<SimulatedKernel::Call>& calls = invariants->undisturbed().calls;
  for (std::size_t operation = 0; operation < calls.size(); ++operation) {
    for (const NamedFault& named : kFaults) {
      const bool canHit = named.error != 0 || calls[operation].line.starts_with("write ");
      if (!canHit || !report.takes(scenario.name, operation, named.name)) {
        continue;
      }
      const Fault fault = {operation, named.error, named.duration};
      const Run run = runOn(scenario.disk, scenario, {.fault = fault});
      Complaint complaint = invariants->ofFaultedRun(run, fault);
      if (!complaint) {
        complaint = invariants->ofNextRun(run.disk);
      }
      report.judge(complaint, calls[operation].line);
    }
  }
  report.add("system calls", calls.size());
  report.add("distinct disks afterwards", invariants->distinctDisks());
  report.add("legacy stores removed without a save", invariants->removalsWithoutSave());
}

}  // namespace

bool runFaultCampaign(const std::vector<Scenario>& scenarios, const Selection& selection) {
  Report report(selection);
  for (const Scenario& scenario : scenarios) {
    if (report.takes(scenario.name)) {
      tryFaultsIn(scenario, report);
    }
  }
  return report.finish("faults", kFewestFaults);
}

}  // namespace accounts
