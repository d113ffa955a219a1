#pragma once

#include <cstdint>
#include <string>
#include <string_view>
#include <vector>

namespace accounts {

/// The files of a device that a migration replaces or removes, as device paths.
struct AccountFiles {
  std::string settings;
  std::string legacyMail;
  std::string legacyExchange;
  /// What the plug-in leaves while it removes the legacy stores.
  std::string removalSentinel;

  /// The files that hold accounts, in the order in which they are put back: the settings file
  /// last, for as long as a legacy store is there, the next migration converts it.
  [[nodiscard]] std::vector<std::string> inputs() const {
    return {legacyMail, legacyExchange, settings};
  }
};

/// The files of a device whose mobile user has this home directory, a device path.
AccountFiles accountFilesInHome(std::string_view home);

/// The version of the settings file's layout after a migration.
inline constexpr std::int64_t kMigratedVersion = 12;

/// The directory of the host's own, in which it keeps files.
inline constexpr std::string_view kAccountMigrationDirectory =
    "/var/mobile/Library/AccountMigration";

/// The lock that the plug-in holds while it migrates.
inline constexpr std::string_view kMigrationLockName = "AccountMigrationInProgress";

/// A path taken apart at its last separator.
std::string_view directoryOf(std::string_view path);
std::string_view nameOf(std::string_view path);
/// A directory's path with a name appended.
std::string pathIn(std::string_view directory, std::string_view name);

}  // namespace accounts
