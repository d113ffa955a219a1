#pragma once

#include <cstdint>

namespace accounts {

/// What stands under a name, a symbolic link there not followed.
enum class EntryKind : std::uint8_t {
  Nothing,
  RegularFile,
  Directory,
  /// A symbolic link, a named pipe, a socket or a device.
  Other
};

/// A moment, as a file system writes it down.
struct FileTime {
  std::int64_t seconds = 0;
  std::int64_t nanoseconds = 0;
  bool operator==(const FileTime&) const = default;
};

/// Enough of what stands under a name to tell later whether it still does, untouched. The time of
/// the last access and the number of names do not count.
struct FileIdentity {
  EntryKind kind = EntryKind::Nothing;
  std::uint64_t device = 0;
  std::uint64_t inode = 0;
  std::uint64_t size = 0;
  /// Kind and permissions as the system counts them.
  std::uint32_t mode = 0;
  FileTime modified;
  /// Also moves when a file gets a name or loses one.
  FileTime changed;

  bool operator==(const FileIdentity&) const = default;

  /// Whether two are the same but for `changed`.
  [[nodiscard]] bool isSameFileAs(const FileIdentity& other) const {
    FileIdentity mine = *this;
    mine.changed = other.changed;
    return mine == other;
  }
  [[nodiscard]] bool exists() const { return kind != EntryKind::Nothing; }
};

}  // namespace accounts
