#pragma once

#include <gtest/gtest.h>

#include <cstdint>
#include <filesystem>
#include <nlohmann/json.hpp>
#include <optional>
#include <string>
#include <string_view>
#include <vector>

#include "propertylist/value/PropertyValue.h"
#include "tests/fakes/StoreContents.h"
#include "tests/program/RunProgram.h"

namespace accounts {

// Device paths that these tests speak of.
inline constexpr const char* kSettingsPath =
    "/var/mobile/Library/Preferences/com.quarx.accountsettings.plist";
inline constexpr const char* kSettingsCopyPath =
    "/var/mobile/Library/Logs/CrashReporter/com.quarx.accountsettings.plist";
inline constexpr const char* kLegacyMailPath = "/var/mobile/Library/Mail/Accounts.plist";
inline constexpr const char* kLegacyExchangePath =
    "/var/mobile/Library/Preferences/com.quarx.DataAccess.plist";
inline constexpr const char* kSentinelPath = "/var/mobile/Library/Preferences/.removingOldAccounts";
inline constexpr const char* kAutoFetchPath = "/var/mobile/Library/Mail/AutoFetchEnabled";
inline constexpr const char* kLoggingPreferencesPath =
    "/var/mobile/Library/Preferences/com.quarx.accountsettings-logging.plist";
inline constexpr const char* kInformationDirectory =
    "/var/mobile/Library/Logs/CrashReporter/AccountMigration";
inline constexpr const char* kLockPath = "/tmp/AccountMigrationInProgress";
inline constexpr const char* kDevicePropertyListPath = "/etc/device.plist";

/// Where a device root lies: on the machine's disk, or in memory if the machine has such a place,
/// for tests of hundreds of runs, which would mostly wait for the disk.
enum class Medium : std::uint8_t { Disk, Memory };

/// Makes a directory with a name that begins like this and is nobody else's.
std::filesystem::path makeTemporaryDirectory(Medium medium, const std::string& name);

/// A device root in a temporary directory, and the real host to run on it. The root starts with the
/// directories that every device has, a user "mobile" who is the test's own user, and no accounts.
class DeviceRootFixture : public testing::Test {
 public:
  DeviceRootFixture(const DeviceRootFixture&) = delete;
  DeviceRootFixture& operator=(const DeviceRootFixture&) = delete;

 protected:
  explicit DeviceRootFixture(Medium medium = Medium::Disk);
  ~DeviceRootFixture() override;

  /// Where a device path lies on this machine.
  [[nodiscard]] std::filesystem::path onThisMachine(std::string_view devicePath) const;
  /// The root itself, as an argument.
  [[nodiscard]] std::string root() const { return onThisMachine("/").string(); }

  /// Writes a file, its directories included; a property list in the binary format.
  void write(std::string_view devicePath, const PropertyValue& value) const;
  void writeText(std::string_view devicePath, std::string_view text) const;
  /// Copies a directory of this machine over the root. The user "mobile" stays the test's own.
  void copyOverRoot(const std::filesystem::path& directory) const;
  /// Makes a user of this machine the device's "mobile" and the owner of the whole root.
  void giveTo(uid_t user) const;

  [[nodiscard]] bool exists(std::string_view devicePath) const;
  [[nodiscard]] std::string readText(std::string_view devicePath) const;
  /// The dictionary in a file; a failure of the test when there is none.
  [[nodiscard]] PropertyDictionary readDictionary(std::string_view devicePath) const;
  /// The device paths of all files beneath the root, sorted.
  [[nodiscard]] std::vector<std::string> files() const;

  /// Runs `migration-host run --root` on the root with further arguments.
  ProgramResult migrate(const std::vector<std::string>& arguments = {}) const;
  /// How migrate() runs the host, to change before it is run.
  [[nodiscard]] ProgramCall migrationCall(const std::vector<std::string>& arguments = {}) const;

 private:
  void makeMobile(uid_t user, gid_t group) const;

  std::filesystem::path directory_;
};

/// The one object that standard output holds, on one line; a failure of the test when it holds
/// anything else.
nlohmann::json onlyObject(const ProgramResult& result);

}  // namespace accounts
