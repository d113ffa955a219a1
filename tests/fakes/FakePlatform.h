#pragma once

#include <string>
#include <string_view>
#include <vector>

#include "accountsettings/Process.h"
#include "tests/fakes/FakeServices.h"

namespace accounts {

/// A whole device in memory: one fake of every interface, with the directories that every device
/// has. Everything that changes the device or speaks to others is recorded in `journal`, in order.
class FakePlatform {
 public:
  FakePlatform();

  std::vector<std::string> journal;

  FakeBundleResources bundleResources;
  FakeCloudAccountService cloudAccountService;
  FakeCloudTabService cloudTabService{journal};
  FakeConsoleLog consoleLog{journal};
  FakeDateFormatter dateFormatter;
  FakeDeviceInfoService deviceInfoService;
  FakeExternalSyncSources externalSyncSources;
  FakeFileSystem fileSystem{journal};
  FakeFrameworkLoader frameworkLoader;
  FakeHomeDirectory homeDirectory;
  FakeLocalizedStrings localizedStrings;
  FakeLogSystem logSystem;
  FakeMailDirectory mailDirectory;
  FakePairingValueStore pairingValueStore;
  FakePreferenceDomain preferenceDomain;
  FakePreferencesBroadcast preferencesBroadcast{journal};
  FakeProfileRestrictions profileRestrictions;
  FakePropertyLists propertyLists{fileSystem};
  FakeSharedResources sharedResources{journal};
  FakeUUIDGenerator uuidGenerator;

  Platform platform;

  /// Writes a value as a binary property list to a path, with missing parent directories.
  void addPropertyList(std::string_view path, const PropertyValue& value);
  /// The dictionary that the file at a path holds; none for a missing or unreadable one. Not
  /// recorded.
  [[nodiscard]] std::optional<PropertyDictionary> dictionaryAt(std::string_view path) const;
};

/// A fake device together with a process of its own, for the length of a test.
struct FakeProcess : FakePlatform {
  Process process{platform};
};

/// Where the files of a fake device stand.
inline constexpr std::string_view kSettingsPath =
    "/var/mobile/Library/Preferences/com.quarx.accountsettings.plist";
inline constexpr std::string_view kLegacyMailPath = "/var/mobile/Library/Mail/Accounts.plist";
inline constexpr std::string_view kLegacyExchangePath =
    "/var/mobile/Library/Preferences/com.quarx.DataAccess.plist";
inline constexpr std::string_view kSentinelPath =
    "/var/mobile/Library/Preferences/.removingOldAccounts";

}  // namespace accounts
