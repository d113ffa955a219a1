#include <algorithm>
#include <functional>
#include <optional>
#include <string>

#include "accountsettings/AccountsManager.h"
#include "fuzz/AccountValues.h"
#include "fuzz/CarriedOver.h"
#include "fuzz/DeviceServices.h"
#include "fuzz/FuzzTarget.h"
#include "fuzz/FuzzedDevice.h"
#include "migrator/AccountsDataMigrator.h"

namespace accounts {

namespace {

std::ptrdiff_t saves(const FuzzedDevice& device) {
  return std::ranges::count_if(device.journal, [](const std::string& line) {
    return line.starts_with("rename ") && line.ends_with(kSettingsPath);
  });
}

/// One migration in a process of its own. None when the world stopped in its midst.
std::optional<bool> migrate(FuzzedDevice& device) {
  const Process process(device.platform);
  try {
    return AccountsDataMigrator().performMigration();
  } catch (const WorldStopped&) {
    return std::nullopt;
  }
}

/// Makes one operation on files fail, or lets it be the last one before the process is killed. True
/// when there is such a fault; half of the devices have none. Which one is drawn from the
/// whole input, because a mutation of a long one seldom meets a certain byte.
bool addFault(std::string_view bytes, FakeFileSystem& files) {
  constexpr std::size_t kChoices = 8;
  constexpr std::size_t kOperations = 64;
  const std::size_t draw = std::hash<std::string_view>()(bytes);
  const std::size_t operation = draw / kChoices % kOperations;
  switch (draw % kChoices) {
    case 4:
      files.failAt(operation);
      return true;
    case 5:
      files.failFrom(operation);
      return true;
    case 6:
      files.stopBefore(operation);
      return true;
    case 7:
      files.stopAfter(operation);
      return true;
    default:
      return false;
  }
}

/// What holds whatever went wrong: the settings file is the old one or a complete new one.
void checkSettingsFile(FuzzedDevice& device, const std::optional<std::string>& bytesBefore) {
  const bool isUnchanged = device.fileSystem.contentsOf(kSettingsPath) == bytesBefore;
  require(isUnchanged || saves(device) > 0, "only a save replaces the settings file");
  if (!isUnchanged) {
    const Process process(device.platform);
    static_cast<void>(device.savedAccounts());
  }
}

void checkResult(const FuzzedDevice& device, bool result) {
  require(result == device.sharedResources.canMakeLock,
          "a migration gives true unless there is no lock");
  const auto times = [&](std::string_view beginning) {
    return std::ranges::count_if(
        device.journal, [&](const std::string& line) { return line.starts_with(beginning); });
  };
  require(times("lock ") == times("unlock "), "the lock is given back");
}

/// Whatever a run left, further ones finish, and come to rest. Two are allowed for: what the first
/// one writes without being able to keep it, as a mail account of an unknown class, the second one
/// drops.
void checkRest(FuzzedDevice& device) {
  device.fileSystem.removeFaults();
  constexpr int kRunsToRest = 2;
  for (int run = 0; run < kRunsToRest; ++run) {
    require(migrate(device) == device.sharedResources.canMakeLock, "a further run ends as ruled");
  }
  const std::optional<std::string> bytes = device.fileSystem.contentsOf(kSettingsPath);
  require(migrate(device) == device.sharedResources.canMakeLock, "the last run ends as ruled");
  require(device.fileSystem.contentsOf(kSettingsPath) == bytes,
          "a migrated device is left as it is");
}

}  // namespace

/// A whole device with any settings file, any legacy stores, any answers of its services and
/// perhaps a fault is migrated, and migrated again.
void runOneInput(std::string_view bytes) {
  FuzzInput input(bytes);
  FuzzedDevice device;
  addServices(input, device);
  const bool hasFault = addFault(bytes, device.fileSystem);
  device.addAnything(input, kSettingsPath, settingsFrom);
  device.addAnything(input, kLegacyMailPath, legacyMailFrom);
  device.addAnything(input, kLegacyExchangePath, legacyExchangeFrom);
  const CarriedOver carriedOver(device);
  // A fault may hide the sentinel.
  const bool mayReplaceSettings =
      device.sharedResources.canMakeLock && (hasFault || !device.has(kSentinelPath));
  const std::optional<std::string> settings = device.fileSystem.contentsOf(kSettingsPath);

  const std::optional<bool> result = migrate(device);

  checkSettingsFile(device, settings);
  require(mayReplaceSettings || saves(device) == 0,
          "without the lock, and while a removal is finished, nothing is saved");
  if (result) {
    checkResult(device, *result);
  }
  if (!hasFault) {
    require(result.has_value(), "a migration ends");
    require(device.fileSystem.temporaryFiles().empty(), "no temporary file stays");
    if (saves(device) > 0) {
      const Process process(device.platform);
      carriedOver.checkAfterMigration(device);
    }
  }
  checkRest(device);
}

}  // namespace accounts
