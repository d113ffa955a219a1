#include "host/PlanCommand.h"

#include <unistd.h>

#include <string>
#include <utility>
#include <vector>

#include "host/PluginRun.h"
#include "host/RootLock.h"
#include "platform/ReplacedParts.h"
#include "platform/linux/LinuxSharedResources.h"
#include "platform/linux/OwnerNames.h"
#include "platform/overlay/OverlayFileSystem.h"
#include "platform/overlay/OverlayPropertyLists.h"
#include "platform/overlay/OverlaySharedResources.h"
#include "safetynet/MigrationCheck.h"

namespace accounts {
namespace {

/// The kernel's rule: a privileged process gives files to anybody, another one only to itself.
class KernelOwnershipRule final : public OwnershipRule {
 public:
  explicit KernelOwnershipRule(const DeviceRoot& root) : names_(root) {}

  Result canGive(std::string_view ownerName, std::string_view groupName) override {
    PathError error;
    const auto user = names_.userIdentifier(std::string(ownerName), error);
    const auto group = user ? names_.groupIdentifier(std::string(groupName), error) : std::nullopt;
    if (!group) {
      return Result::failure(error.text);
    }
    const bool isAllowed = ::geteuid() == 0 || (*user == ::geteuid() && *group == ::getegid());
    return isAllowed ? Result::success()
                     : Result::failure("A file cannot be given to " + std::string(ownerName) +
                                       ": Operation not permitted");
  }

 private:
  OwnerNames names_;
};

/// The device's platform with everything that changes files in memory.
struct PlannedPlatform {
  PlannedPlatform(LinuxPlatform& linux, std::string temporaryDirectory)
      : ownership(linux.root()),
        files(linux.fileSystem(), ownership, std::move(temporaryDirectory)),
        propertyLists(files, linux.propertyLists()),
        sharedResources(files, linux.platform().sharedResources, std::string(kLockDirectory)),
        platform(platformWith(linux.platform(), {.fileSystem = &files,
                                                 .propertyLists = &propertyLists,
                                                 .sharedResources = &sharedResources})) {}

  KernelOwnershipRule ownership;
  OverlayFileSystem files;
  OverlayPropertyLists propertyLists;
  OverlaySharedResources sharedResources;
  Platform platform;
};

/// What a run's verification would find of a result in memory.
void foreseeVerification(LinuxPlatform& linux, PropertyLists& planned, const AccountFiles& files,
                         RunReport& report) {
  if (const auto problem = whyNotMigrated(planned, files.settings, report.settingsSaves.last)) {
    setError(report, {ExitStatus::NotVerified, "The result would not be verified: " + *problem});
    return;
  }
  std::vector<std::string> inputs = files.inputs();
  std::erase_if(inputs,
                [&](const std::string& path) { return !linux.fileSystem().fileExists(path); });
  const auto readInput = [&](const std::string& path) {
    return linux.propertyLists().readDictionary(path);
  };
  for (std::string& sentence : whatMayBeMissing(planned, files, inputs, readInput)) {
    report.warnings.push_back(std::move(sentence) + "; a run would keep the files as they were");
  }
}

HostOutcome planWithPlugin(const PlanOptions& options, const OpenedDevice& device,
                           StopSignals& stop) {
  LinuxPlatform& linux = *device.platform;
  ProgramError lockError;
  const auto rootLock = RootLock::take(linux.root(), options.device.lockTimeout, &stop, lockError);
  if (!rootLock) {
    return failedOutcome(lockError);
  }
  PlannedPlatform planned(linux, linux.fileSystem().temporaryDirectory());
  const AccountFiles files = accountFilesInHome(linux.platform().homeDirectory.path());
  return outcomeOf(runPluginInChild({.bundle = device.bundle,
                                     .platform = planned.platform,
                                     .linux = linux,
                                     .files = files,
                                     .recorded = options.secrets,
                                     .inspect =
                                         [&](const Platform& platform, RunReport& report) {
                                           if (report.result) {
                                             foreseeVerification(linux, platform.propertyLists,
                                                                 files, report);
                                           }
                                         }},
                                    stop));
}

}  // namespace

HostOutcome planMigration(const PlanOptions& options) {
  return outcomeOnDevice(options.device, [&](const OpenedDevice& device, StopSignals& stop) {
    return planWithPlugin(options, device, stop);
  });
}

}  // namespace accounts
