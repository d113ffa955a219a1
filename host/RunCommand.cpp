#include "host/RunCommand.h"

#include <algorithm>
#include <memory>
#include <utility>
#include <variant>

#include "host/ChildProcess.h"
#include "host/PluginBundle.h"
#include "platform/linux/LinuxPlatform.h"

namespace accounts {
namespace {

ExitStatus exitStatusOf(LinuxPlatformError::Kind kind) {
  switch (kind) {
    case LinuxPlatformError::Kind::UnusableOption:
      return ExitStatus::UnusableArguments;
    case LinuxPlatformError::Kind::MissingInput:
      return ExitStatus::MissingInput;
    case LinuxPlatformError::Kind::CannotCreate:
      return ExitStatus::CannotCreate;
    case LinuxPlatformError::Kind::InputOutput:
      break;
  }
  return ExitStatus::InputOutputError;
}

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

/// Loads the plug-in and lets it migrate, all in this process.
RunReport runPlugin(const PluginBundle& bundle, LinuxPlatform& platform) {
  RunReport report;
  std::variant<std::unique_ptr<MigrationPluginBase>, HostError> made =
      bundle.makePlugin(platform.platform());
  if (const auto* error = std::get_if<HostError>(&made)) {
    setError(report, *error);
    return report;
  }
  auto& plugin = std::get<std::unique_ptr<MigrationPluginBase>>(made);
  report.dataClassName = plugin->dataClassName();
  report.result = plugin->performMigration();
  plugin.reset();

  report.broadcasts = platform.preferencesBroadcast().changes();
  const std::vector<CloudTabs>& announcements = platform.cloudTabService().announcements();
  report.cloudTabAnnouncements = static_cast<std::size_t>(
      std::count(announcements.begin(), announcements.end(), CloudTabs::On));
  if (!report.result) {
    setError(report, {ExitStatus::MigrationFailed, "The plug-in reported that it failed"});
  }
  return report;
}

/// Runs the plug-in in a child process, so that whatever ends it leaves someone to report it.
std::variant<RunReport, HostError> runPluginInChild(const PluginBundle& bundle,
                                                    LinuxPlatform& platform) {
  const std::variant<std::string, HostError> outcome =
      runInChildProcess([&] { return jsonText(runPlugin(bundle, platform)); });
  if (const auto* error = std::get_if<HostError>(&outcome)) {
    return *error;
  }
  std::optional<RunReport> report = reportFromJSONText(std::get<std::string>(outcome));
  if (!report) {
    return HostError{ExitStatus::PluginEnded, "The plug-in left no result"};
  }
  return *std::move(report);
}

std::variant<RunReport, HostError> findAndRunPlugin(const RunOptions& options) {
  const std::variant<PluginBundle, HostError> bundle = PluginBundle::find(options.plugin);
  if (const auto* error = std::get_if<HostError>(&bundle)) {
    return *error;
  }
  const auto& found = std::get<PluginBundle>(bundle);
  LinuxPlatformError error;
  const std::unique_ptr<LinuxPlatform> platform =
      LinuxPlatform::create(platformOptions(options, found), error);
  if (platform == nullptr) {
    return HostError{exitStatusOf(error.kind), error.text};
  }
  return runPluginInChild(found, *platform);
}

}  // namespace

RunReport runMigration(const RunOptions& options) {
  std::variant<RunReport, HostError> outcome = findAndRunPlugin(options);
  RunReport report;
  if (const auto* error = std::get_if<HostError>(&outcome)) {
    setError(report, *error);
  } else {
    report = std::get<RunReport>(std::move(outcome));
  }
  report.root = options.root;
  return report;
}

}  // namespace accounts
