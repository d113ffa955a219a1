#pragma once

#include <gtest/gtest.h>
#include <sys/types.h>

#include <cstdint>
#include <filesystem>
#include <optional>
#include <ostream>
#include <span>
#include <string>
#include <string_view>

namespace accounts {

/// What a program that looks for a file or directory finds where a device holds something hostile.
enum class Finding : std::uint8_t {
  /// What it looked for.
  Usable,
  /// Nothing: a link that leads nowhere within the device.
  Nothing,
  /// Something that must be refused.
  Refused
};

/// Something that a device may hold where a file or a directory belongs.
struct HostileKind {
  const char* name;
  /// Puts it at `place`, where a usable file or directory (or nothing) is; `outside` is what is at
  /// the same place outside the root. Gives the reason when this system cannot have such a thing.
  std::optional<std::string> (*put)(const std::filesystem::path& place,
                                    const std::filesystem::path& outside);
  /// To a program that reads what is there, following links.
  Finding finding;
  /// To a program that opens what is there without following links, and does not read it whole: as
  /// a lock for instance.
  Finding opened = finding;
  /// Whether it is hostile only to a program that is not run by root.
  bool toOtherUsersOnly = false;
};

/// What stands in the place of files.
std::span<const HostileKind> hostileFileKinds();
/// What stands in the place of directories; `finding` is what a path through it leads to.
std::span<const HostileKind> hostileDirectoryKinds();

/// The kind of a name; a failure of the test when there is none.
const HostileKind& hostileFileKind(std::string_view name);
const HostileKind& hostileDirectoryKind(std::string_view name);

/// Lets a place that was made immutable be removed again; anything else stays as it is.
void makeRemovable(const std::filesystem::path& place);

inline std::ostream& operator<<(std::ostream& stream, const HostileKind& kind) {
  return stream << kind.name;
}

}  // namespace accounts
