#include "accountsctl/StatusCommand.h"

#include <fmt/format.h>

#include <vector>

#include "accountsctl/DevicePlatform.h"
#include "accountsctl/DeviceStatus.h"
#include "accountsctl/JSONText.h"
#include "accountsctl/Rehearsal.h"
#include "accountsctl/TextTable.h"
#include "accountsettings/AccountsManager.h"
#include "commandline/BundleLocation.h"
#include "commandline/PlatformError.h"
#include "platform/linux/LinuxDevicePlaces.h"
#include "propertylist/value/Description.h"
#include "safetynet/PlaceErrors.h"

namespace accounts {
namespace {

LinuxPlatformOptions platformOptions(const StatusOptions& options) {
  LinuxPlatformOptions result;
  result.rootDirectory = options.root;
  result.homeDirectory = options.home.value_or(result.homeDirectory);
  result.deviceDescriptionFile = options.device;
  if (options.bundle) {
    result.bundleResourcesDirectory = resourcesOfBundle(*options.bundle).string();
  }
  return result;
}

std::string versionWords(const DeviceStatus& status) {
  return status.storedVersion ? "version " + describe(*status.storedVersion) : "without a version";
}

std::string settingsWords(const DeviceStatus& status) {
  if (status.settingsProblem) {
    return "unreadable: " + *status.settingsProblem;
  }
  return status.hasSettings ? fmt::format("{} (current is {}), {} {}", versionWords(status),
                                          AccountsManager::currentVersion(), status.accountCount,
                                          status.accountCount == 1 ? "account" : "accounts")
                            : "none";
}

/// A piece of work of a migration.
struct Work {
  std::string_view name;
  std::string words;
};

/// What a migration would do, in its order.
std::vector<Work> worksOf(const DeviceStatus& status) {
  std::vector<Work> works;
  if (status.finishesRemoval) {
    works.push_back(
        {"finishRemoval", "finish an interrupted removal of the legacy stores, and nothing else"});
  }
  if (status.convertsExchangeAccounts) {
    works.push_back({"convertExchangeAccounts", "convert the legacy Exchange accounts"});
  }
  if (status.convertsMailAccounts) {
    works.push_back({"convertMailAccounts", "convert the legacy mail accounts"});
  }
  if (status.upgradesFromVersion) {
    works.push_back(
        {"upgrade", fmt::format("upgrade the accounts from version {} to {}",
                                *status.upgradesFromVersion, AccountsManager::currentVersion())});
  }
  return works;
}

std::string textOf(const DeviceStatus& status, const Rehearsed& rehearsed,
                   const Terminal& terminal) {
  TextTable table({"", ""});
  table.addRow({"Account settings", settingsWords(status)});
  std::string_view label = "A migration would";
  for (const Work& work : worksOf(status)) {
    table.addRow({std::string(label), work.words});
    label = "";
  }
  if (!label.empty()) {
    table.addRow({std::string(label), "find nothing to do"});
  }
  for (const std::string& folder : status.keptFolders) {
    table.addRow({"Kept inputs", folder});
  }
  for (const std::string& file : status.abandonedFiles) {
    table.addRow({"Abandoned file", file});
  }
  return table.text(terminal) + linesOf(rehearsed);
}

std::string objectLine(const StatusOptions& options, const DeviceStatus& status,
                       const Rehearsed& rehearsed, ExitStatus exitStatus) {
  JSON works = JSON::array();
  for (const Work& work : worksOf(status)) {
    works.push_back(work.name);
  }
  JSON object = reportObject("status");
  object["root"] = options.root;
  object["settings"] = {
      {"path", status.settingsPath},
      {"exists", status.hasSettings},
      {"problem", status.settingsProblem ? JSON(*status.settingsProblem) : JSON(nullptr)},
      {"version", status.storedVersion ? jsonOf(*status.storedVersion) : JSON(nullptr)},
      {"accounts", status.accountCount}};
  object["currentVersion"] = AccountsManager::currentVersion();
  object["work"] = std::move(works);
  object["ledger"] = ledgerObject(rehearsed);
  object["keptFolders"] = status.keptFolders;
  object["abandonedFiles"] = status.abandonedFiles;
  object["pending"] = status.isPending();
  return lineOf(std::move(object), exitStatus);
}

}  // namespace

CommandResult status(const StatusOptions& options, const Terminal& terminal,
                     const CommandWorker& worker) {
  const auto opened = DevicePlatform::open(platformOptions(options));
  if (!opened) {
    return opened.error();
  }
  DevicePlatform& device = **opened;
  LinuxPlatform& linux = device.linuxPlatform();
  if (const auto isDevice = checkIsDevice(linux.root(), options.root); !isDevice) {
    return isDevice.error();
  }
  LinuxDevicePlaces places(linux.root(), linux.fileSystem(), linux.platform().homeDirectory.path());
  const auto taken = places.takeSnapshot();
  if (!taken) {
    return readingError(taken.error());
  }
  const DeviceSnapshot& snapshot = *taken;
  auto leftovers = leftoversOn(linux);
  if (!leftovers) {
    return readingError(leftovers.error());
  }
  DeviceStatus found = *std::move(leftovers);
  worker.giveUpRights(openInputsOf(snapshot));
  if (const auto decoded = device.decode(); !decoded) {
    return decoded.error();
  }
  lookAtDevice(linux, snapshot, found);
  const ExitStatus exitStatus =
      options.failsIfPending && found.isPending() ? ExitStatus::Attention : ExitStatus::Success;
  const Rehearsed rehearsed = rehearse(linux, snapshot);
  // What this machine lacks or its medium does not give says nothing of the device.
  if (!rehearsed && (rehearsed.error().exitStatus == ExitStatus::TemporaryFailure ||
                     rehearsed.error().exitStatus == ExitStatus::InputOutputError)) {
    return rehearsed.error();
  }
  return CommandReport{options.reportsJSON ? objectLine(options, found, rehearsed, exitStatus)
                                           : textOf(found, rehearsed, terminal),
                       exitStatus};
}

}  // namespace accounts
