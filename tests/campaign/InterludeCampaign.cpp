#include <algorithm>
#include <map>
#include <string>

#include "safetynet/CommitRecord.h"
#include "tests/campaign/Campaigns.h"
#include "tests/campaign/KilledDisks.h"
#include "tests/campaign/LegacyStores.h"
#include "tests/campaign/SettingsContents.h"
#include "tests/campaign/TransactionInvariants.h"

namespace accounts {

namespace {

constexpr std::size_t kFewestInterludes = 100'000;

constexpr unsigned kSecondRun = 4;
constexpr unsigned kBareRun = 5;

/// What happens on a device between a run that was killed and the next one.
enum class Interlude : std::uint8_t {
  Remount,
  SettingsAreRewritten,
  StoresComeBack,
  SettingsComeBack,
  AllComesBack,
  BareRun
};

struct NamedInterlude {
  std::string_view name;
  Interlude interlude;
};
constexpr NamedInterlude kInterludes[] = {{"remount", Interlude::Remount},
                                          {"settings-rewritten", Interlude::SettingsAreRewritten},
                                          {"stores-back", Interlude::StoresComeBack},
                                          {"settings-back", Interlude::SettingsComeBack},
                                          {"all-back", Interlude::AllComesBack},
                                          {"bare-run", Interlude::BareRun}};

class InterruptedScenario {
 public:
  InterruptedScenario(const Scenario& scenario, Report& report)
      : scenario_(scenario), report_(report), invariants_(scenario) {}

  void tryAll() {
    const Run& run = invariants_.undisturbed();
    const std::vector<SimulatedDisk> disks = disksOf(scenario_.disk, run);
    std::optional<std::uint64_t> previous;
    for (std::size_t operation = 0; operation < disks.size(); ++operation) {
      const std::uint64_t fingerprint = disks[operation].fingerprint();
      if (fingerprint == previous) {
        continue;
      }
      previous = fingerprint;
      for (const NamedInterlude& each : kInterludes) {
        const std::string fault = std::string(each.name) + "-after-" + std::to_string(operation);
        if (report_.mayTake(scenario_.name, fault)) {
          tryInterlude(disks[operation], each.interlude, fault);
        }
      }
    }
    report_.add("distinct disks", invariants_.distinctDisks());
  }

 private:
  /// The next run is killed before each of its calls, too, and comes to its end.
  void tryInterlude(SimulatedDisk disk, Interlude interlude, const std::string& fault) {
    const Ending& expected = expectedAfter(disk, interlude);
    happen(disk, interlude);
    const Run second =
        runOn(disk, scenario_, {.recording = SimulatedKernel::Recording::On, .number = kSecondRun});
    const std::vector<SimulatedDisk> disks = disksOf(disk, second);
    for (std::size_t operation = 0; operation < disks.size(); ++operation) {
      if (report_.takes(scenario_.name, operation, fault)) {
        report_.judge(invariants_.ofNextRun(disks[operation], expected),
                      operation < second.calls.size() ? second.calls[operation].line : "the end");
      }
    }
  }

  void happen(SimulatedDisk& disk, Interlude interlude) const {
    switch (interlude) {
      case Interlude::Remount:
        disk.remount();
        return;
      case Interlude::SettingsAreRewritten:
        rewriteSettings(disk);
        return;
      case Interlude::StoresComeBack:
        for (const LegacyStore& each : kLegacyStores) {
          bringBack(disk, each.store);
        }
        return;
      case Interlude::SettingsComeBack:
        bringBack(disk, DevicePlace::Settings);
        return;
      case Interlude::AllComesBack:
        happen(disk, Interlude::StoresComeBack);
        happen(disk, Interlude::SettingsComeBack);
        return;
      case Interlude::BareRun:
        disk = runOn(disk, scenario_, {.number = kBareRun, .host = Scenario::Host::Bare}).disk;
        return;
    }
  }

  static void rewriteSettings(SimulatedDisk& disk) {
    const std::string path = pathOf(DevicePlace::Settings);
    const std::string contents = withFurtherAccount(disk.contentsOf(path), "REWRITTEN");
    OtherProgram(disk).replace(path, contents);
  }

  void bringBack(SimulatedDisk& disk, DevicePlace place) const {
    OtherProgram(disk).bringBack(pathOf(place), scenario_.disk);
  }

  [[nodiscard]] bool hasAllStores(const SimulatedDisk& disk) const {
    return std::ranges::all_of(kLegacyStores, [&](const LegacyStore& each) {
      return disk.exists(pathOf(each.store)) || !scenario_.disk.exists(pathOf(each.store));
    });
  }

  /// How the device must end at last.
  const Ending& expectedAfter(const SimulatedDisk& disk, Interlude interlude) {
    if (interlude == Interlude::AllComesBack &&
        !scenario_.disk.exists(pathOf(DevicePlace::Settings))) {
      // No backup takes away a settings file.
      interlude = Interlude::StoresComeBack;
    }
    const bool isOld = invariants_.hasOldSettings(disk);
    const SimulatedDisk& end = invariants_.undisturbed().disk;
    const bool hasRecord = disk.exists(pathOf(DevicePlace::CommitRecord));
    switch (interlude) {
      case Interlude::SettingsAreRewritten: {
        // Another program's account is beside those that were there when it wrote.
        SimulatedDisk rewritten = isOld ? scenario_.disk : end;
        rewriteSettings(rewritten);
        return ending(isOld ? "old-rewritten" : "new-rewritten", rewritten);
      }
      case Interlude::StoresComeBack: {
        if (hasRecord || hasAllStores(disk)) {
          break;
        }
        // The migration is over. This is a device with settings and stores like any.
        SimulatedDisk restored = end;
        happen(restored, interlude);
        return ending("restored", restored);
      }
      case Interlude::AllComesBack: {
        if (hasRecord || hasAllStores(disk) ||
            !scenario_.disk.exists(pathOf(DevicePlace::RemovalSentinel))) {
          break;
        }
        // All but the sentinel, which said that the stores were carried over.
        SimulatedDisk restored = scenario_.disk;
        restored.removeFile(pathOf(DevicePlace::RemovalSentinel));
        return ending("without-sentinel", restored);
      }
      case Interlude::SettingsComeBack: {
        if (isOld || !scenario_.disk.exists(pathOf(DevicePlace::Settings))) {
          break;
        }
        // What was carried over is lost with the settings file that had it.
        const SimulatedDisk restored = withoutStoresGoneFrom(disk, scenario_.disk);
        return ending("without-" + std::to_string(restored.fingerprint()), restored);
      }
      default:
        break;
    }
    return invariants_.ending();
  }

  /// That of an undisturbed run on a disk that has a name.
  const Ending& ending(const std::string& name, const SimulatedDisk& disk) {
    const auto known = endings_.find(name);
    return known != endings_.end()
               ? known->second
               : endings_.emplace(name, invariants_.endingAfterRun(disk)).first->second;
  }

  const Scenario& scenario_;
  Report& report_;
  TransactionInvariants invariants_;
  std::map<std::string, Ending> endings_;
};

}  // namespace

bool runInterludeCampaign(const std::vector<Scenario>& scenarios, const Selection& selection) {
  Report report(selection);
  for (const Scenario& scenario : scenarios) {
    if (report.takes(scenario.name) && scenario.host == Scenario::Host::Transaction &&
        scenario.action == Scenario::Action::Migration) {
      InterruptedScenario(scenario, report).tryAll();
    }
  }
  return report.finish("interludes", kFewestInterludes);
}

}  // namespace accounts
