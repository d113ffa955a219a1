#include <algorithm>
#include <functional>
#include <limits>
#include <set>
#include <string>
#include <vector>

#include "tests/campaign/ActEndings.h"
#include "tests/campaign/Campaigns.h"
#include "tests/campaign/Intruder.h"
#include "tests/campaign/KilledDisks.h"
#include "tests/campaign/SettingsContents.h"
#include "tests/campaign/TransactionInvariants.h"
#include "vocabulary/AccountVocabulary.h"
#include "vocabulary/DevicePath.h"

namespace accounts {

namespace {

constexpr std::size_t kFewestIntrusions = 70'000;
constexpr unsigned kNextRun = 2;
/// So many calls after an act the run is killed at each of them.
constexpr std::size_t kMostKills = 12;

constexpr std::size_t kCallsInVain = 3;

constexpr std::size_t kWithoutEnd = std::numeric_limits<std::size_t>::max();

constexpr NamedAct kActs[] = {
    {"settings-replaced", DevicePlace::Settings, Act::Replaces},
    {"settings-replaced-blindly", DevicePlace::Settings, Act::ReplacesBlindly},
    {"settings-replaced-blindly-twice", DevicePlace::Settings, Act::ReplacesBlindly, 2},
    {"settings-replaced-blindly-thrice", DevicePlace::Settings, Act::ReplacesBlindly, 3},
    {"settings-replaced-blindly-from-then-on", DevicePlace::Settings, Act::ReplacesBlindly,
     kWithoutEnd},
    {"settings-written", DevicePlace::Settings, Act::Writes},
    {"settings-written-twice", DevicePlace::Settings, Act::Writes, 2},
    {"settings-removed", DevicePlace::Settings, Act::Removes},
    {"settings-back", DevicePlace::Settings, Act::BringsBack},
    {"mail-replaced", DevicePlace::LegacyMail, Act::Replaces},
    {"mail-replaced-blindly-twice", DevicePlace::LegacyMail, Act::ReplacesBlindly, 2},
    {"mail-written", DevicePlace::LegacyMail, Act::Writes},
    {"mail-removed", DevicePlace::LegacyMail, Act::Removes},
    {"mail-back", DevicePlace::LegacyMail, Act::BringsBack},
    {"exchange-replaced", DevicePlace::LegacyExchange, Act::Replaces},
    {"exchange-written", DevicePlace::LegacyExchange, Act::Writes},
    {"exchange-removed", DevicePlace::LegacyExchange, Act::Removes},
    {"copy-aside-replaced", DevicePlace::CopyAside, Act::Replaces},
    {"original-replaced", DevicePlace::LegacyMailOriginal, Act::Replaces},
};

class DisturbedScenario {
 public:
  DisturbedScenario(const Scenario& scenario, Report& report)
      : scenario_(scenario), report_(report), invariants_(scenario) {}

  void tryAll() {
    for (const NamedAct& act : kActs) {
      const bool needsFile = act.act == Act::Removes || act.act == Act::BringsBack;
      if (needsFile && !scenario_.disk.exists(pathOf(act.place))) {
        continue;
      }
      for (std::size_t operation = 0; operation < calls_.size(); ++operation) {
        if (!isNewMoment(act, operation)) {
          continue;
        }
        ++newMoments_;
        if (report_.takes(scenario_.name, operation, act.name)) {
          report_.judge(tryAct(act, operation), calls_[operation].line);
        }
      }
      tryKills(act);
      tryLocks(act);
    }
    report_.add("system calls", calls_.size());
    report_.add("moments", calls_.size() * std::size(kActs));
    report_.add("moments that differ from the next", newMoments_);
    report_.add("attempts given up", givenUp_);
    report_.add("runs given up", ranIntoLimit_);
    report_.add("files lost for want of exchanges", lostWithoutExchange_);
    report_.add("older files kept for a person", keptForAPerson_);
  }

 private:
  /// Whether a call sees or changes what stands at a place or beside it. A call that gives a file
  /// a further name tells only of the latter.
  [[nodiscard]] bool concerns(std::size_t operation, DevicePlace place) const {
    const std::string& line = calls_[operation].line;
    const std::string_view path = std::string_view(line).substr(line.find(' ') + 1);
    const std::string own = pathOf(place);
    return path == own || path == splitPath(own).directory || isTemporary(path) ||
           line.starts_with("linkat ");
  }

  /// Whether it makes a difference that a program acts from before this call on rather than from
  /// before the next one.
  [[nodiscard]] bool isNewMoment(const NamedAct& act, std::size_t operation) const {
    const std::size_t count = act.count == kWithoutEnd ? 1 : act.count;
    for (std::size_t each = operation; each < std::min(operation + count, calls_.size()); ++each) {
      if (concerns(each, act.place)) {
        return true;
      }
    }
    return false;
  }

  /// Between the last look at a file and a plain rename in its place there is nothing to be done.
  [[nodiscard]] bool isInTheWindow(const NamedAct& act, std::size_t operation) const {
    return !scenario_.abilities.exchangesNames && act.place == DevicePlace::Settings &&
           calls_[operation].line == "renameat " + pathOf(act.place);
  }

  Complaint countedOutsideTheWindow(Complaint complaint, const NamedAct& act,
                                    std::size_t operation) {
    if (complaint && isInTheWindow(act, operation)) {
      ++lostWithoutExchange_;
      return std::nullopt;
    }
    return complaint;
  }

  Complaint tryAct(const NamedAct& act, std::size_t operation) {
    Intruder intruder(act, scenario_.disk, writings_);
    const Run run = runOn(scenario_.disk, scenario_,
                          {.intrusion = Intrusion{operation, act.count, std::ref(intruder)}});
    givenUp_ += run.handover.attempts > 0 ? run.handover.attempts - 1 : 0;
    ranIntoLimit_ += run.exitStatus == ExitStatus::TemporaryFailure ? 1 : 0;
    if (run.openDescriptors != 0) {
      return "a descriptor stayed open";
    }
    Complaint complaint = ofWhatWasWritten(act, intruder, run);
    if (!complaint && act.count != kWithoutEnd) {
      complaint = ofEnding(endings_.beforeOrAfter(act, intruder.times()), run);
    }
    return countedOutsideTheWindow(complaint, act, operation);
  }

  /// The run is killed at each of the calls that follow an act.
  void tryKills(const NamedAct& act) {
    const std::string fault = std::string(act.name) + "-then-killed";
    // What holds of one store holds of the other: they are removed alike.
    const bool isTried =
        (act.act == Act::ReplacesBlindly && act.count != kWithoutEnd) ||
        (act.act == Act::Writes && act.count == 1 && act.place != DevicePlace::LegacyExchange);
    if (!isTried || !report_.mayTake(scenario_.name, fault)) {
      return;
    }
    std::set<std::uint64_t> judged;
    for (std::size_t operation = 0; operation < calls_.size(); ++operation) {
      if (!report_.mayTake(operation) || !isNewMoment(act, operation)) {
        continue;
      }
      Intruder intruder(act, scenario_.disk, writings_);
      const Run run = runOn(scenario_.disk, scenario_,
                            {.recording = SimulatedKernel::Recording::On,
                             .intrusion = Intrusion{operation, act.count, std::ref(intruder)}});
      std::size_t kill = operation + act.count;
      for (const SimulatedDisk& disk : disksOf(scenario_.disk, run, kill, kMostKills)) {
        if (judged.insert(disk.fingerprint()).second &&
            report_.takes(scenario_.name, operation, fault)) {
          report_.judge(
              countedOutsideTheWindow(ofNextRun(act, operation, intruder, disk), act, operation),
              kill < run.calls.size() ? run.calls[kill].line : "the end");
        }
        ++kill;
      }
    }
  }

  Complaint ofNextRun(const NamedAct& act, std::size_t operation, const Intruder& intruder,
                      const SimulatedDisk& disk) {
    const Run next = runOn(disk, scenario_, {.number = kNextRun});
    if (const Complaint complaint = ofWhatWasWritten(act, intruder, next)) {
      return complaint;
    }
    Complaint complaint = ofEnding(endings_.beforeOrAfter(act, intruder.times()), next);
    if (complaint && act.place == DevicePlace::Settings && hasNewSettings(operation)) {
      complaint = ofEnding({endings_.withoutGoneStores(act, intruder.times(), disk)}, next);
    }
    if (complaint && tellsOfOlderFile(next)) {
      ++keptForAPerson_;
      return std::nullopt;
    }
    return complaint;
  }

  /// Whether a run leaves a file of another program beside its place, since a newer one has that,
  /// and says so.
  [[nodiscard]] static bool tellsOfOlderFile(const Run& run) {
    return std::ranges::any_of(temporaryFiles(run.disk), [&](const std::string& path) {
      return std::ranges::any_of(run.warnings, [&](const std::string& warning) {
        return warning.find(path + ": File exists") != std::string::npos;
      });
    });
  }

  /// Another process has a lock that the run waits for, and acts before it gives it back.
  void tryLocks(const NamedAct& act) {
    if (act.count != 1) {
      return;
    }
    std::size_t number = 0;
    for (const char* const path : {"/", kAccountMigrationLockFilename}) {
      if (report_.takes(scenario_.name, number++, std::string(act.name) + "-under-a-lock")) {
        Intruder intruder(act, scenario_.disk, writings_);
        SimulatedDisk disk = scenario_.disk;
        disk.addFile(kAccountMigrationLockFilename, "");
        const Run run = runOn(disk, scenario_,
                              {.otherLock = OtherLock{path, kCallsInVain, std::ref(intruder)}});
        report_.judge(intruder.times() == 1
                          ? ofEnding({endings_.before(act, 1, std::move(disk))}, run)
                          : "the run did not wait for the lock",
                      "flock " + std::string(path));
      }
    }
  }

  /// Whether what another program wrote last is in its place, or its account in the result.
  [[nodiscard]] Complaint ofWhatWasWritten(const NamedAct& act, const Intruder& intruder,
                                           const Run& run) const {
    // With a sentinel, stores are removed unconverted: that is the plug-in's rule.
    const bool isConverted =
        !scenario_.disk.exists(pathOf(DevicePlace::RemovalSentinel)) &&
        (act.place == DevicePlace::LegacyMail || act.place == DevicePlace::LegacyExchange);
    const bool isInput = act.place == DevicePlace::Settings || isConverted;
    if (!intruder.written() || !isInput ||
        run.disk.contentsOf(pathOf(act.place)) == intruder.written()) {
      return std::nullopt;
    }
    // A store that cannot be converted is kept.
    for (const std::string& path : run.disk.filesBeneath(kAccountMigrationDirectory)) {
      if (path.find("/Kept-") != std::string::npos &&
          run.disk.contentsOf(path) == intruder.written()) {
        return std::nullopt;
      }
    }
    const std::set<std::string> identifiers =
        identifiersOf(run.disk.contentsOf(pathOf(DevicePlace::Settings)));
    return identifiers.contains(intruder.identifier())
               ? Complaint()
               : "what another program wrote is lost; exit status " +
                     std::to_string(static_cast<int>(run.exitStatus)) + ", " + run.error;
  }

  /// Whether the device ends in one of these ways, after a next run that has nothing in its way.
  [[nodiscard]] Complaint ofEnding(const std::vector<Ending>& possible, const Run& run) const {
    const Run next = runOn(run.disk, scenario_, {.number = kNextRun});
    const Ending ending = invariants_.endingOf(next.disk, next.exitStatus);
    Complaint difference;
    for (const Ending& each : possible) {
      difference = differenceOf(each, ending);
      if (!difference) {
        return std::nullopt;
      }
    }
    return "the device ends neither as if another program had acted before nor as if after: " +
           *difference;
  }

  /// Whether the undisturbed run has replaced the settings file before a call.
  [[nodiscard]] bool hasNewSettings(std::size_t operation) const {
    return !invariants_.hasOldSettings(
        disksOf(scenario_.disk, invariants_.undisturbed(), operation, 1).front());
  }

  const Scenario& scenario_;
  Report& report_;
  TransactionInvariants invariants_;
  const std::vector<SimulatedKernel::Call>& calls_ = invariants_.undisturbed().calls;
  Writings writings_;
  ActEndings endings_{scenario_, invariants_, writings_};
  std::size_t newMoments_ = 0;
  std::size_t givenUp_ = 0;
  std::size_t ranIntoLimit_ = 0;
  std::size_t lostWithoutExchange_ = 0;
  std::size_t keptForAPerson_ = 0;
};

}  // namespace

bool runOtherProgramsCampaign(const std::vector<Scenario>& scenarios, const Selection& selection) {
  Report report(selection);
  for (const Scenario& scenario : scenarios) {
    if (report.takes(scenario.name) && scenario.host == Scenario::Host::Transaction &&
        scenario.action == Scenario::Action::Migration) {
      DisturbedScenario(scenario, report).tryAll();
    }
  }
  return report.finish("other-programs", kFewestIntrusions);
}

}  // namespace accounts
