#pragma once

#include <cstdint>
#include <optional>
#include <string>
#include <string_view>

#include "vocabulary/DevicePlaces.h"

namespace accounts {

/// The name that a file has beside its place while it is to get it, or was moved away from it:
/// ".accounts-migration-PLACE-MADE-REPLACED-RANDOM". Whatever stops the process, the next one knows
/// by it whose the file is: one with either inode number is the host's own or was to go, any other
/// one was taken from its place by chance and belongs there.
struct StagedName {
  DevicePlace place = DevicePlace::Settings;
  /// The inode number of the file that was made; 0 for none.
  std::uint64_t made = 0;
  /// The inode number of the file that it replaces or that is removed; 0 for none.
  std::uint64_t replaced = 0;

  /// A name like this that no other file has; none when the system has no random bytes.
  [[nodiscard]] std::optional<std::string> text() const;
  /// What a name says; none when it is no such name.
  static std::optional<StagedName> parse(std::string_view name);
};

}  // namespace accounts
