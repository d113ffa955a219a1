#include "host/PluginRun.h"

#include <algorithm>
#include <memory>
#include <utility>
#include <vector>

#include "host/ChildProcess.h"
#include "host/StageNames.h"
#include "platform/ReplacedParts.h"
#include "report/MigrationRecorder.h"
#include "report/RecordedPlatform.h"
#include "safetynet/SaveObserver.h"

namespace accounts {
namespace {

/// Loads the plug-in and lets it migrate, all in this process.
RunReport runPlugin(const PluginRun& run, Platform& platform) {
  SaveObserver saves(platform.fileSystem, run.files.settings);
  StageNames stages(platform.migrationObserver);
  Platform observed = platformWith(platform, {.fileSystem = &saves, .migrationObserver = &stages});
  RunReport report;
  std::variant<std::unique_ptr<MigrationPluginBase>, ProgramError> made =
      run.bundle.makePlugin(observed);
  if (const auto* error = std::get_if<ProgramError>(&made)) {
    setError(report, *error);
    return report;
  }
  auto& plugin = std::get<std::unique_ptr<MigrationPluginBase>>(made);
  report.dataClassName = plugin->dataClassName();
  report.result = plugin->performMigration();
  plugin.reset();

  report.steps = stages.names();
  report.settingsSaves = saves.saves();
  report.broadcasts = run.linux.preferencesBroadcast().changes();
  const std::vector<CloudTabs>& announcements = run.linux.cloudTabService().announcements();
  report.cloudTabAnnouncements = static_cast<std::size_t>(
      std::count(announcements.begin(), announcements.end(), CloudTabs::On));
  if (!report.result) {
    setError(report, {ExitStatus::MigrationFailed, "The plug-in reported that it failed"});
  }
  if (run.inspect) {
    run.inspect(observed, report);
  }
  return report;
}

/// The files that hold accounts, those that can be read.
std::vector<StoreFile> storesOf(PropertyLists& propertyLists, const AccountFiles& files) {
  const std::pair<FileKind, const std::string&> places[] = {
      {FileKind::AccountSettings, files.settings},
      {FileKind::ExchangeStore, files.legacyExchange},
      {FileKind::MailStore, files.legacyMail}};
  std::vector<StoreFile> stores;
  for (const auto& [kind, path] : places) {
    if (std::optional<PropertyDictionary> content = propertyLists.readDictionary(path)) {
      stores.push_back({kind, *std::move(content)});
    }
  }
  return stores;
}

RunReport runRecordedPlugin(const PluginRun& run, const WriteLine& writeLine) {
  MigrationRecorder recorder(writeLine, *run.recorded);
  RecordedPlatform recorded(run.platform, recorder);
  recorder.recordBefore(storesOf(run.platform.propertyLists, run.files));
  RunReport report = runPlugin(run, recorded.platform());
  recorder.recordAfter(run.platform.propertyLists.readDictionary(run.files.settings));
  return report;
}

}  // namespace

PluginOutcome runPluginInChild(const PluginRun& run, StopSignals& stop) {
  ChildOutcome child = runInChildProcess(
      [&](const WriteLine& writeLine) {
        Platform platform = run.platform;
        return jsonText(run.recorded ? runRecordedPlugin(run, writeLine)
                                     : runPlugin(run, platform));
      },
      stop);
  PluginOutcome outcome;
  outcome.recorded = RecordedMigration::fromLines(child.lines);
  if (const auto* error = std::get_if<ProgramError>(&child.result)) {
    outcome.report = *error;
  } else if (auto report = reportFromJSONText(std::get<std::string>(child.result))) {
    outcome.report = *std::move(report);
  } else {
    outcome.report = ProgramError{ExitStatus::PluginEnded, "The plug-in left no result"};
  }
  return outcome;
}

RunReport reportOf(std::variant<RunReport, ProgramError> outcome) {
  if (auto* report = std::get_if<RunReport>(&outcome)) {
    return std::move(*report);
  }
  RunReport report;
  setError(report, std::get<ProgramError>(outcome));
  return report;
}

}  // namespace accounts
