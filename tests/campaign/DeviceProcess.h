#pragma once

#include <cstddef>
#include <optional>
#include <string>
#include <string_view>
#include <vector>

#include "platform/linux/DescribedCloudAccountService.h"
#include "platform/linux/DescribedDeviceInfoService.h"
#include "platform/linux/DescribedExternalSyncSources.h"
#include "platform/linux/DescribedPairingValueStore.h"
#include "platform/linux/DescribedProfileRestrictions.h"
#include "platform/linux/DeviceDescription.h"
#include "platform/linux/DeviceRoot.h"
#include "platform/linux/LinuxFileSystem.h"
#include "platform/linux/LinuxHomeDirectory.h"
#include "platform/linux/LinuxMailDirectory.h"
#include "platform/linux/LinuxPreferenceDomain.h"
#include "platform/linux/LinuxPropertyLists.h"
#include "platform/linux/LinuxSharedResources.h"
#include "tests/fakes/FakePlatform.h"
#include "vocabulary/DevicePlaces.h"

namespace accounts {

/// The home directory on every device of the campaign.
inline constexpr std::string_view kHome = "/var/mobile";

/// Where a place is on them.
inline std::string pathOf(DevicePlace place) {
  return pathOfPlace(place, kHome);
}

/// Remembers what is turned into an account settings file.
class ObservedPropertyLists final : public PropertyLists {
 public:
  explicit ObservedPropertyLists(PropertyLists& real) : real_(real) {}
  std::vector<std::string> settingsWritten;

  std::optional<PropertyDictionary> readDictionary(std::string_view path) override {
    return real_.readDictionary(path);
  }
  OrFailure<SerializedPropertyList> serializeBinary(const PropertyValue& value) override;

 private:
  PropertyLists& real_;
};

/// UUIDs that count up and differ from run to run.
class CountingUUIDs final : public UUIDGenerator {
 public:
  explicit CountingUUIDs(unsigned run) : run_(run) {}
  std::optional<std::string> randomUUID() override;

 private:
  unsigned run_;
  unsigned count_ = 0;
};

/// The Linux platform on the simulated device: all that works with files is the real thing.
struct DeviceProcess {
  /// `run` makes what is made up differ from that of other runs. A simulated kernel must be alive.
  DeviceProcess(const DeviceDescription& description, unsigned run);

  std::vector<std::string> journal;
  const DeviceRoot root;
  LinuxFileSystem fileSystem{root, std::string(kHome) + "/tmp"};
  LinuxPropertyLists realPropertyLists{root};
  ObservedPropertyLists propertyLists{realPropertyLists};
  LinuxHomeDirectory homeDirectory{kHome};
  LinuxMailDirectory mailDirectory{homeDirectory};
  LinuxPreferenceDomain preferenceDomain{realPropertyLists, homeDirectory};
  LinuxSharedResources sharedResources{root};
  DescribedCloudAccountService cloudAccountService;
  DescribedDeviceInfoService deviceInfoService;
  DescribedExternalSyncSources externalSyncSources;
  DescribedPairingValueStore pairingValueStore;
  DescribedProfileRestrictions profileRestrictions;
  CountingUUIDs uuidGenerator;
  FakeBundleResources bundleResources;
  FakeCloudTabService cloudTabService{journal};
  FakeConsoleLog consoleLog{journal};
  FakeDateFormatter dateFormatter;
  FakeFrameworkLoader frameworkLoader;
  FakeLocalizedStrings localizedStrings;
  FakeLogSystem logSystem;
  FakePreferencesBroadcast preferencesBroadcast{journal};
  Platform platform = {.bundleResources = bundleResources,
                       .cloudAccountService = cloudAccountService,
                       .cloudTabService = cloudTabService,
                       .consoleLog = consoleLog,
                       .dateFormatter = dateFormatter,
                       .deviceInfoService = deviceInfoService,
                       .externalSyncSources = externalSyncSources,
                       .fileSystem = fileSystem,
                       .frameworkLoader = frameworkLoader,
                       .homeDirectory = homeDirectory,
                       .localizedStrings = localizedStrings,
                       .logSystem = logSystem,
                       .mailDirectory = mailDirectory,
                       .pairingValueStore = pairingValueStore,
                       .preferenceDomain = preferenceDomain,
                       .preferencesBroadcast = preferencesBroadcast,
                       .profileRestrictions = profileRestrictions,
                       .propertyLists = propertyLists,
                       .sharedResources = sharedResources,
                       .uuidGenerator = uuidGenerator};
};

}  // namespace accounts
