#include "host/RunCommand.h"

#include <algorithm>
#include <memory>
#include <utility>
#include <variant>

#include "commandline/PlatformError.h"
#include "host/ChildProcess.h"
#include "host/CurrentTime.h"
#include "host/HeldLock.h"
#include "host/PluginBundle.h"
#include "host/RootLock.h"
#include "platform/linux/LinuxPlatform.h"
#include "safetynet/SafetyNet.h"
#include "safetynet/SaveObserver.h"

namespace accounts {
namespace {

LinuxPlatformOptions platformOptions(const RunOptions& options, const PluginBundle& bundle) {
  LinuxPlatformOptions result;
  result.rootDirectory = options.root;
  result.homeDirectory = options.home.value_or(result.homeDirectory);
  result.temporaryDirectory = options.temporaryDirectory;
  result.bundleResourcesDirectory = bundle.resourcesDirectory().string();
  result.deviceDescriptionFile = options.deviceDescription;
  result.channel = options.channel;
  return result;
}

/// The platform as the plug-in sees it, with its saves observed.
struct ObservedPlatform {
  ObservedPlatform(LinuxPlatform& linuxPlatform, const AccountFiles& files)
      : linux(linuxPlatform),
        saves(linuxPlatform.fileSystem(), files.settings),
        platform(linuxPlatform.platformWith(saves)) {}

  LinuxPlatform& linux;
  SaveObserver saves;
  Platform platform;
};

/// Loads the plug-in and lets it migrate, all in this process.
RunReport runPlugin(const PluginBundle& bundle, ObservedPlatform& observed) {
  RunReport report;
  std::variant<std::unique_ptr<MigrationPluginBase>, ProgramError> made =
      bundle.makePlugin(observed.platform);
  if (const auto* error = std::get_if<ProgramError>(&made)) {
    setError(report, *error);
    return report;
  }
  auto& plugin = std::get<std::unique_ptr<MigrationPluginBase>>(made);
  report.dataClassName = plugin->dataClassName();
  report.result = plugin->performMigration();
  plugin.reset();

  report.settingsSaves = observed.saves.saves();
  report.broadcasts = observed.linux.preferencesBroadcast().changes();
  const std::vector<CloudTabs>& announcements = observed.linux.cloudTabService().announcements();
  report.cloudTabAnnouncements = static_cast<std::size_t>(
      std::count(announcements.begin(), announcements.end(), CloudTabs::On));
  if (!report.result) {
    setError(report, {ExitStatus::MigrationFailed, "The plug-in reported that it failed"});
  }
  return report;
}

/// Runs the plug-in in a child process, so that whatever ends it leaves someone to report it.
std::variant<RunReport, ProgramError> runPluginInChild(const PluginBundle& bundle,
                                                       ObservedPlatform& observed) {
  const std::variant<std::string, ProgramError> outcome =
      runInChildProcess([&] { return jsonText(runPlugin(bundle, observed)); });
  if (const auto* error = std::get_if<ProgramError>(&outcome)) {
    return *error;
  }
  std::optional<RunReport> report = reportFromJSONText(std::get<std::string>(outcome));
  if (!report) {
    return ProgramError{ExitStatus::PluginEnded, "The plug-in left no result"};
  }
  return *std::move(report);
}

/// What a person types to put kept files back, without the folder.
std::string restoreCommand(const RunOptions& options) {
  std::string command = "migration-host restore --root " + options.root;
  if (options.home) {
    command += " --home " + *options.home;
  }
  return command;
}

PluginEnd endOf(const std::variant<RunReport, ProgramError>& outcome) {
  if (const auto* report = std::get_if<RunReport>(&outcome)) {
    return report->result ? PluginEnd::GaveTrue : PluginEnd::GaveFalse;
  }
  return PluginEnd::Died;
}

RunReport reportOf(std::variant<RunReport, ProgramError> outcome) {
  if (auto* report = std::get_if<RunReport>(&outcome)) {
    return std::move(*report);
  }
  RunReport report;
  setError(report, std::get<ProgramError>(outcome));
  return report;
}

/// Runs the plug-in with its inputs kept around it.
std::variant<RunReport, ProgramError> runPluginSafely(const RunOptions& options,
                                                      const PluginBundle& bundle,
                                                      const AccountFiles& files,
                                                      ObservedPlatform& observed) {
  PathError lockError;
  const auto rootLock = RootLock::take(observed.linux.root(), lockError);
  if (!rootLock) {
    return ProgramError{ExitStatus::CannotCreate, lockError.text};
  }
  SafetyNet safetyNet(observed.linux.fileSystem(), observed.platform.propertyLists, files,
                      restoreCommand(options));
  if (const Result kept = safetyNet.keepInputs(currentTimeText()); !kept) {
    return ProgramError{ExitStatus::CannotCreate, "The files cannot be kept: " + kept.error()};
  }
  std::variant<RunReport, ProgramError> outcome = runPluginInChild(bundle, observed);
  const PluginEnd end = endOf(outcome);
  RunReport report = reportOf(std::move(outcome));
  std::optional<HeldLock> migrationLock;
  if (end == PluginEnd::Died || report.dataClassName) {
    // Readers that wait for the migration wait until it is verified or undone, too. Where the
    // plug-in could not be loaded, not even the lock's file is made.
    migrationLock.emplace(observed.platform.sharedResources, kMigrationLockName);
  }
  Settlement settlement = safetyNet.settle(end, report.settingsSaves);
  if (settlement.error) {
    setError(report, *settlement.error);
  }
  report.warnings = std::move(settlement.warnings);
  report.keptInputs = std::move(settlement.keptFolders);
  return report;
}

std::variant<RunReport, ProgramError> findAndRunPlugin(const RunOptions& options) {
  const std::variant<PluginBundle, ProgramError> bundle = PluginBundle::find(options.plugin);
  if (const auto* error = std::get_if<ProgramError>(&bundle)) {
    return *error;
  }
  const auto& found = std::get<PluginBundle>(bundle);
  LinuxPlatformError error;
  const std::unique_ptr<LinuxPlatform> platform =
      LinuxPlatform::create(platformOptions(options, found), error);
  if (platform == nullptr) {
    return programErrorOf(error);
  }
  const AccountFiles files = accountFilesInHome(platform->platform().homeDirectory.path());
  ObservedPlatform observed(*platform, files);
  return options.bare ? runPluginInChild(found, observed)
                      : runPluginSafely(options, found, files, observed);
}

}  // namespace

RunReport runMigration(const RunOptions& options) {
  RunReport report = reportOf(findAndRunPlugin(options));
  report.root = options.root;
  return report;
}

}  // namespace accounts
