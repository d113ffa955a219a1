#pragma once

#include <array>
#include <cstddef>
#include <cstdint>
#include <optional>
#include <string>
#include <string_view>

#include "vocabulary/DevicePath.h"

namespace accounts {

/// The places on a device that a migration may read or change: all of them, and nothing else is
/// touched by a run.
enum class DevicePlace : std::uint8_t {
  /// The account settings file.
  Settings,
  /// The Exchange service's older store, and the copy of it that another program may have left.
  LegacyExchange,
  LegacyExchangeOriginal,
  /// The mail application's older store, and the same.
  LegacyMail,
  LegacyMailOriginal,
  /// What stands while the legacy stores are removed.
  RemovalSentinel,
  /// The copy of the settings file as it was before the newest migration, for engineers.
  CopyAside,
  /// A file of the mail application's that a migration makes void.
  AutoFetchEnabled,
  /// The directory of the migration-information files; a run makes at most one file there.
  InformationDirectory,
  /// The preferences that switch the migration-information file on.
  LoggingPreferences,
  /// What the host leaves while it commits a run that removes legacy stores.
  CommitRecord
};

/// The name of the user, and of the group, that the settings file belongs to.
inline constexpr std::string_view kSettingsFileOwner = "mobile";

/// One place.
struct ListedPlace {
  enum class Base : std::uint8_t { System, Home };
  DevicePlace place;
  /// A name for files that belong to the place, such as a kept copy: one word.
  std::string_view name;
  /// What `path` starts from: the root of the device or the home directory of its mobile user.
  Base base;
  std::string_view path;
};

/// The closed list of them, in the order of the enumeration.
inline constexpr std::array kDevicePlaces = {
    ListedPlace{DevicePlace::Settings, "Settings", ListedPlace::Base::System,
                "/var/mobile/Library/Preferences/com.quarx.accountsettings.plist"},
    ListedPlace{DevicePlace::LegacyExchange, "LegacyExchange", ListedPlace::Base::Home,
                "/Library/Preferences/com.quarx.DataAccess.plist"},
    ListedPlace{DevicePlace::LegacyExchangeOriginal, "LegacyExchangeOriginal",
                ListedPlace::Base::Home,
                "/Library/Preferences/com.quarx.DataAccess.plist.original"},
    ListedPlace{DevicePlace::LegacyMail, "LegacyMail", ListedPlace::Base::Home,
                "/Library/Mail/Accounts.plist"},
    ListedPlace{DevicePlace::LegacyMailOriginal, "LegacyMailOriginal", ListedPlace::Base::Home,
                "/Library/Mail/Accounts.plist.original"},
    ListedPlace{DevicePlace::RemovalSentinel, "RemovalSentinel", ListedPlace::Base::Home,
                "/Library/Preferences/.removingOldAccounts"},
    ListedPlace{DevicePlace::CopyAside, "CopyAside", ListedPlace::Base::System,
                "/var/mobile/Library/Logs/CrashReporter/com.quarx.accountsettings.plist"},
    ListedPlace{DevicePlace::AutoFetchEnabled, "AutoFetchEnabled", ListedPlace::Base::Home,
                "/Library/Mail/AutoFetchEnabled"},
    ListedPlace{DevicePlace::InformationDirectory, "InformationDirectory", ListedPlace::Base::Home,
                "/Library/Logs/CrashReporter/AccountMigration"},
    ListedPlace{DevicePlace::LoggingPreferences, "LoggingPreferences", ListedPlace::Base::Home,
                "/Library/Preferences/com.quarx.accountsettings-logging.plist"},
    ListedPlace{DevicePlace::CommitRecord, "CommitRecord", ListedPlace::Base::System,
                "/var/mobile/Library/AccountMigration/CommitRecord"}};

inline constexpr std::size_t kDevicePlaceCount = kDevicePlaces.size();

constexpr std::size_t indexOf(DevicePlace place) {
  return static_cast<std::size_t>(place);
}

constexpr const ListedPlace& listed(DevicePlace place) {
  return kDevicePlaces[indexOf(place)];
}

/// The device path of a place on a device whose mobile user has this home directory.
inline std::string pathOfPlace(DevicePlace place, std::string_view home) {
  const ListedPlace& found = listed(place);
  return joinedPath(found.base == ListedPlace::Base::Home ? home : "/", found.path);
}

/// The place that has a name; none when none has it.
inline std::optional<DevicePlace> placeNamed(std::string_view name) {
  for (const ListedPlace& each : kDevicePlaces) {
    if (each.name == name) {
      return each.place;
    }
  }
  return std::nullopt;
}

/// The preferences, as other programs call them, at `LoggingPreferences`.
inline constexpr std::string_view kLoggingPreferences = "com.quarx.accountsettings-logging";
static_assert(listed(DevicePlace::LoggingPreferences)
                  .path.ends_with("/com.quarx.accountsettings-logging.plist"));

/// The names of the migration-information files begin and end like this.
inline constexpr std::string_view kInformationFilePrefix = "AccountMigrationInformation-";
inline constexpr std::string_view kInformationFileSuffix = ".txt";

/// What the removal sentinel holds.
inline constexpr std::string_view kRemovalSentinelContents =
    "Old Account Information Removal Sentinel";

/// The directory of the host's own, in which it keeps files and its commit record.
inline constexpr std::string_view kAccountMigrationDirectory =
    "/var/mobile/Library/AccountMigration";

/// Directories that every device has.
inline constexpr std::array<std::string_view, 3> kDeviceDirectories = {"/var/mobile", "/etc",
                                                                       "/tmp"};

/// The lock that a migration holds.
inline constexpr std::string_view kMigrationLockName = "AccountMigrationInProgress";

/// The version of the settings file's layout after a migration: the number of upgrade steps.
inline constexpr std::int64_t kMigratedVersion = 12;

}  // namespace accounts
