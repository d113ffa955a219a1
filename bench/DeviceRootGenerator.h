#pragma once

#include <cstddef>
#include <cstdint>
#include <filesystem>
#include <optional>
#include <string>

namespace accounts {

/// Which stores of older builds a device still has.
enum class LegacyStores { None, Mail, Exchange, Both };

struct DeviceRootDescription {
  /// The directory to write; it is made if it is missing.
  std::filesystem::path root;
  /// Top-level accounts in the account settings file. Each legacy store gets one for every four of
  /// them, at least one.
  std::size_t accountCount = 0;
  /// The account settings file's "Version".
  std::int64_t version = 0;
  LegacyStores legacyStores = LegacyStores::None;
};

/// Writes a device root whose every file is the same each time but for the numbers of the user
/// "mobile", who is the current user, so that no privileges are needed to migrate it. Files that
/// the description does not name are left alone. None on success, otherwise what went wrong.
std::optional<std::string> writeDeviceRoot(const DeviceRootDescription& description);

}  // namespace accounts
