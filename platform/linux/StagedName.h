#pragma once

#include <cstdint>
#include <optional>
#include <string>
#include <string_view>

#include "platform/FileIdentity.h"
#include "vocabulary/DevicePlaces.h"

namespace accounts {

/// A number that stands for a file as it is, whatever its name and the disk's number are: any other
/// file has another one, and so has this one when it was written. 0 for nothing.
std::uint64_t markOf(const FileIdentity& file);

/// The name that a file has beside its place while it is to get it, or was moved away from it:
/// ".accounts-migration-PLACE-MADE-REPLACED-RETURNED-RANDOM". Whatever stops the process, the next
/// one knows by it what each of the two files is.
struct StagedName {
  DevicePlace place = DevicePlace::Settings;
  /// The mark of the file that was put in the place or is to be put there, which may go; 0 for
  /// none.
  std::uint64_t made = 0;
  /// The mark of the file that it replaces or that is removed, which may go, too; 0 for none.
  std::uint64_t replaced = 0;
  /// The mark of a file of another program that is given its place back; 0 for none.
  std::uint64_t returned = 0;

  /// A name like this that no other file has; none when the system has no random bytes.
  [[nodiscard]] std::optional<std::string> text() const;
  /// What a name says; none when it is no such name.
  static std::optional<StagedName> parse(std::string_view name);
};

}  // namespace accounts
