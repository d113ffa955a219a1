#include "tests/campaign/BareInvariants.h"

#include <algorithm>
#include <array>

#include "accountsettings/AccountsManager.h"
#include "tests/campaign/SettingsContents.h"
#include "tests/program/StoredVersionsComparison.h"
#include "vocabulary/AccountVocabulary.h"

namespace accounts {

namespace {

constexpr std::string_view kInformationDirectory =
    "/var/mobile/Library/Logs/CrashReporter/AccountMigration";

bool contains(const std::vector<std::string>& texts, std::string_view text) {
  return std::ranges::find(texts, text) != texts.end();
}

}  // namespace

BareInvariants::BareInvariants(const Scenario& scenario)
    : scenario_(scenario),
      undisturbed_(runOn(scenario.disk, scenario, {.recording = SimulatedKernel::Recording::On})),
      textsBefore_(textsOn(scenario.disk)),
      settingsBefore_(scenario.disk.contentsOf(kSettingsPath)) {
  const std::optional<std::string> end = undisturbed_.disk.contentsOf(kSettingsPath);
  std::set<std::string> before = identifiersOf(settingsBefore_);
  for (const std::string_view path : {kLegacyMailPath, kLegacyExchangePath}) {
    if (const std::optional<std::string> contents = scenario.disk.contentsOf(path)) {
      const std::set<std::string> identifiers = identifiersOf(contents);
      before.insert(identifiers.begin(), identifiers.end());
      legacyStores_.push_back(
          {std::string(path), *contents, intersection(identifiers, identifiersOf(end))});
    }
  }
  keptIdentifiers_ = intersection(before, identifiersOf(end));
  if (scenario.disk.exists(kSentinelPath)) {
    // A run that does not see the sentinel converts the legacy stores, and what is converted takes
    // the place of accounts that the settings file has.
    SimulatedDisk withoutSentinel = scenario.disk;
    withoutSentinel.removeFile(kSentinelPath);
    const Run conversion = runOn(withoutSentinel, scenario, {});
    keptIdentifiers_ =
        intersection(keptIdentifiers_, identifiersOf(conversion.disk.contentsOf(kSettingsPath)));
  }
  if (end && dictionaryIn(*end)) {
    end_ = named(*end);
  }
}

PropertyValue BareInvariants::named(const std::string& settingsBytes) const {
  return withNamedIdentifiers(dictionaryIn(settingsBytes).value_or(PropertyDictionary()),
                              textsBefore_);
}

const std::set<std::string>& BareInvariants::identifiersIn(const std::string& settingsBytes) {
  const auto known = identifiers_.find(settingsBytes);
  return known != identifiers_.end()
             ? known->second
             : identifiers_.emplace(settingsBytes, identifiersOf(settingsBytes)).first->second;
}

Complaint BareInvariants::ofSettings(const SimulatedDisk& disk,
                                     const std::vector<std::string>& settingsWritten) const {
  const std::optional<std::string> settings = disk.contentsOf(kSettingsPath);
  if (settings == settingsBefore_ || (settings && contains(settingsWritten, *settings))) {
    return std::nullopt;
  }
  return settings ? "the settings file is neither the old one nor a whole new one"
                  : "the settings file is gone";
}

const BareInvariants::LegacyStore* BareInvariants::lostStore(const SimulatedDisk& disk) {
  for (const LegacyStore& store : legacyStores_) {
    if (disk.contentsOf(store.path) != store.contents &&
        !std::ranges::includes(identifiersIn(disk.contentsOf(kSettingsPath).value_or("")),
                               store.identifiers)) {
      return &store;
    }
  }
  return nullptr;
}

bool BareInvariants::isUntouched(const SimulatedDisk& disk) const {
  return disk.contentsOf(kSettingsPath) == settingsBefore_ &&
         disk.exists(kSentinelPath) == scenario_.disk.exists(kSentinelPath) &&
         std::ranges::all_of(legacyStores_, [&](const LegacyStore& store) {
           return disk.contentsOf(store.path) == store.contents;
         });
}

Complaint BareInvariants::ofFaultedRun(const Run& run, const Fault& fault) {
  if (const Complaint complaint = ofSettings(run.disk, run.settingsWritten)) {
    return complaint;
  }
  if (run.openDescriptors != 0) {
    return "a descriptor stayed open";
  }
  if (!run.succeeded && !isUntouched(run.disk)) {
    return "the run failed at once but changed the device";
  }
  const bool isSaved = !run.settingsWritten.empty() &&
                       run.disk.contentsOf(kSettingsPath) == run.settingsWritten.back();
  if (const LegacyStore* store = lostStore(run.disk)) {
    // Kept on purpose: a store that cannot be read counts as an empty one, and a save's failure
    // keeps no store.
    if (isSaved && !contains(run.refusedPaths, store->path)) {
      return store->path + " was removed although its accounts were not carried over";
    }
    ++removalsWithoutSave_;
  }
  // Kept on purpose: what is converted takes the place of accounts that the settings file has, also
  // when nothing is, because the legacy store cannot be read.
  const bool allCouldBeRead =
      std::ranges::none_of(std::array{kSettingsPath, kLegacyMailPath, kLegacyExchangePath},
                           [&](std::string_view path) { return contains(run.refusedPaths, path); });
  if (isSaved && allCouldBeRead && settingsBefore_ &&
      !std::ranges::includes(identifiersIn(run.disk.contentsOf(kSettingsPath).value_or("")),
                             intersection(identifiersIn(*settingsBefore_), keptIdentifiers_))) {
    return "accounts of the settings file are gone";
  }
  if (fault.duration == Fault::Duration::Once && fault.error != 0) {
    if (!temporaryFiles(run.disk).empty()) {
      return "a temporary file stays behind";
    }
    const std::string_view directory = kSentinelPath.substr(0, kSentinelPath.rfind('/'));
    if (run.disk.exists(kSentinelPath) && !contains(run.refusedPaths, kSentinelPath) &&
        !contains(run.refusedPaths, directory) && run.succeeded) {
      return "the sentinel stays behind";
    }
  }
  return std::nullopt;
}

Complaint BareInvariants::ofInterruption(const SimulatedDisk& disk,
                                         const std::vector<std::string>& settingsWritten) {
  if (const Complaint complaint = ofSettings(disk, settingsWritten)) {
    return complaint;
  }
  if (const LegacyStore* store = lostStore(disk)) {
    return store->path + " is gone although its accounts are not in the settings file";
  }
  if (disk.exists(kSentinelPath) && !scenario_.disk.exists(kSentinelPath)) {
    // The next run takes the legacy stores for carried over.
    SimulatedDisk withoutStores = disk;
    for (const LegacyStore& store : legacyStores_) {
      withoutStores.removeFile(store.path);
    }
    if (const LegacyStore* store = lostStore(withoutStores)) {
      return "the sentinel gives up " + store->path + " before its accounts are carried over";
    }
  }
  for (const std::string& path : disk.filesBeneath(kInformationDirectory)) {
    if (!isTemporary(path) && !dictionaryIn(*disk.contentsOf(path))) {
      return "the migration-information file is not whole";
    }
  }
  return std::nullopt;
}

Complaint BareInvariants::ofNextRun(const SimulatedDisk& disk) {
  const std::uint64_t fingerprint = disk.fingerprint();
  const auto known = nextRuns_.find(fingerprint);
  return known != nextRuns_.end()
             ? known->second
             : nextRuns_.emplace(fingerprint, judgeNextRun(disk)).first->second;
}

Complaint BareInvariants::judgeNextRun(const SimulatedDisk& disk) {
  const bool isRemoval =
      disk.exists(kSentinelPath) && scenario_.action == Scenario::Action::Migration;
  const Run run = runOn(disk, scenario_, {.number = 2});
  const std::optional<std::string> settings = run.disk.contentsOf(kSettingsPath);
  if (!run.succeeded) {
    return "the next run fails";
  }
  if (run.disk.exists(kSentinelPath) || run.disk.exists(kLegacyMailPath) ||
      run.disk.exists(kLegacyExchangePath)) {
    return "the next run leaves the sentinel or a legacy store";
  }
  if (scenario_.action == Scenario::Action::Migration && !temporaryFiles(run.disk).empty()) {
    return "the next run leaves a temporary file";
  }
  if (isRemoval) {
    return settings == disk.contentsOf(kSettingsPath)
               ? Complaint()
               : "finishing a removal changes the settings file";
  }
  const std::optional<PropertyDictionary> root = settings ? dictionaryIn(*settings) : std::nullopt;
  if (!root || root->find(kPlistVersionKey) == nullptr ||
      *root->find(kPlistVersionKey) != PropertyValue(AccountsManager::currentVersion())) {
    return "the next run leaves no settings file of the current version";
  }
  std::set<std::string> held = identifiersOf(disk.contentsOf(kSettingsPath));
  for (const LegacyStore& store : legacyStores_) {
    held.merge(identifiersOf(disk.contentsOf(store.path)));
  }
  if (!std::ranges::includes(identifiersIn(*settings), intersection(held, keptIdentifiers_))) {
    return "the next run loses accounts";
  }
  if (isUntouched(disk) && named(*settings) != end_) {
    return "the next run on untouched files ends differently";
  }
  // Kept on purpose: a legacy account converted again, over a file in which it has become a child
  // by now, is merged with that child's parent. Two accounts of one identifier differ from save to
  // save.
  if (hasDuplicates(*root)) {
    return std::nullopt;
  }
  const Run third = runOn(run.disk, scenario_, {.number = 3});
  return third.disk.contentsOf(kSettingsPath) == settings
             ? Complaint()
             : "a run with nothing to do changes the file";
}

}  // namespace accounts
