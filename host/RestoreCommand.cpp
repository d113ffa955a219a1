#include "host/RestoreCommand.h"

#include "host/CurrentTime.h"
#include "host/HeldLock.h"
#include "host/RootLock.h"
#include "inspection/PropertyListJSON.h"
#include "platform/linux/DeviceRoot.h"
#include "platform/linux/LinuxFileSystem.h"
#include "platform/linux/LinuxPlatform.h"
#include "platform/linux/LinuxSharedResources.h"
#include "propertylist/Description.h"

namespace accounts {
namespace {

Restoration failed(ExitStatus exitStatus, const std::string& message) {
  Restoration restoration;
  restoration.error = ProgramError{exitStatus, message};
  return restoration;
}

}  // namespace

Restoration runRestoration(const RestoreOptions& options) {
  PathError error;
  const auto root = DeviceRoot::openRoot(options.root, error);
  if (!root) {
    return failed(ExitStatus::MissingInput, error.text);
  }
  ProgramError lockError;
  const auto rootLock =
      RootLock::take(*root, /*timeLimit=*/std::nullopt, /*stop=*/nullptr, lockError);
  if (!rootLock) {
    return failed(lockError.exitStatus, lockError.message);
  }
  LinuxSharedResources sharedResources(*root);
  const HeldLock migrationLock(sharedResources, kMigrationLockName);
  if (!migrationLock.isHeld()) {
    return failed(ExitStatus::CannotCreate,
                  "The migration lock cannot be made in /tmp of the device");
  }
  // No temporary file is made; the directory is only named.
  const std::string home = options.home.value_or(LinuxPlatformOptions().homeDirectory);
  LinuxFileSystem files(*root, home + "/tmp");
  return restoreKeptFiles(files, accountFilesInHome(home), options.folder, currentTimeText());
}

ExitStatus exitStatusOf(const Restoration& restoration) {
  return restoration.error ? restoration.error->exitStatus : ExitStatus::Success;
}

std::string jsonText(const Restoration& restoration, const std::string& root) {
  JSON object = {{"root", root},
                 {"from", textOrNull(restoration.folder)},
                 {"restored", restoration.restored},
                 {"replaced", textOrNull(restoration.replaced)},
                 {"exitStatus", static_cast<int>(exitStatusOf(restoration))}};
  if (restoration.error) {
    object["error"] = restoration.error->message;
  }
  return lineOf(object);
}

std::string summaryText(const Restoration& restoration) {
  std::string summary;
  for (const std::string& path : restoration.restored) {
    summary += "Put back " + escapedText(path) + "\n";
  }
  if (restoration.replaced) {
    summary += "What was there is kept in " + escapedText(*restoration.replaced) + "\n";
  }
  return summary;
}

}  // namespace accounts
