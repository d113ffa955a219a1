#include "host/RunCommand.h"

#include <string>
#include <utility>
#include <variant>

#include "commandline/PlatformError.h"
#include "host/Broadcasting.h"
#include "host/CurrentTime.h"
#include "host/HeldLock.h"
#include "host/PluginRun.h"
#include "host/RootLock.h"
#include "safetynet/SafetyNet.h"

namespace accounts {
namespace {

/// What a person types to put kept files back, without the folder.
std::string restoreCommand(const DeviceOptions& options) {
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

/// Runs the plug-in with its inputs kept around it.
HostOutcome runPluginSafely(const RunOptions& options, const PluginRun& run, StopSignals& stop) {
  ProgramError lockError;
  const auto rootLock =
      RootLock::take(run.linux.root(), options.device.lockTimeout, &stop, lockError);
  if (!rootLock) {
    return failedOutcome(lockError);
  }
  SafetyNet safetyNet(run.linux.fileSystem(), run.platform.propertyLists, run.files,
                      restoreCommand(options.device));
  if (const Result kept = safetyNet.keepInputs(currentTimeText()); !kept) {
    ProgramError error = programErrorOf(kept, ExitStatus::CannotCreate);
    error.message.insert(0, "The files cannot be kept: ");
    return failedOutcome(error);
  }
  PluginOutcome outcome = runPluginInChild(run, stop);
  const PluginEnd end = endOf(outcome.report);
  RunReport report = reportOf(std::move(outcome.report));
  std::optional<HeldLock> migrationLock;
  const bool isStopped = report.exitStatus == ExitStatus::TemporaryFailure;
  if ((end == PluginEnd::Died && !isStopped) || report.dataClassName) {
    // Readers that wait for the migration wait until it is verified or undone, too. Where the
    // plug-in could not be loaded, not even the lock's file is made; nor does a host that is to
    // stop, perhaps because it waits for the lock, wait for it again.
    migrationLock.emplace(run.platform.sharedResources, kMigrationLockName);
  }
  Settlement settlement = safetyNet.settle(end, report.settingsSaves);
  if (settlement.error) {
    setError(report, *settlement.error);
  }
  report.warnings = std::move(settlement.warnings);
  report.keptInputs = std::move(settlement.keptFolders);
  return {std::move(report), std::move(outcome.recorded)};
}

HostOutcome runPlugin(const RunOptions& options, const OpenedDevice& device, StopSignals& stop) {
  LinuxPlatform& linux = *device.platform;
  const AccountFiles files = accountFilesInHome(linux.platform().homeDirectory.path());
  const PluginRun run{.bundle = device.bundle,
                      .platform = linux.platform(),
                      .linux = linux,
                      .files = files,
                      .recorded = options.recorded,
                      .inspect = nullptr};
  if (!options.bare) {
    return runPluginSafely(options, run, stop);
  }
  return outcomeOf(runPluginInChild(run, stop));
}

}  // namespace

HostOutcome runMigration(const RunOptions& options) {
  HostOutcome outcome =
      outcomeOnDevice(options.device, [&](const OpenedDevice& device, StopSignals& stop) {
        return runPlugin(options, device, stop);
      });
  if (options.broadcastsOnDBus) {
    broadcastOnDBus(outcome.report);
  }
  return outcome;
}

}  // namespace accounts
