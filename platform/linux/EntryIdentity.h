#pragma once

#include <fcntl.h>
#include <sys/stat.h>

#include <cerrno>
#include <optional>

#include "platform/FileIdentity.h"

namespace accounts {

inline EntryKind kindOfMode(mode_t mode) {
  switch (mode & S_IFMT) {
    case S_IFREG:
      return EntryKind::RegularFile;
    case S_IFDIR:
      return EntryKind::Directory;
    default:
      return EntryKind::Other;
  }
}

/// What stat gave for an entry, as its identity.
inline FileIdentity identityOf(const struct stat& status) {
  return {.kind = kindOfMode(status.st_mode),
          .device = status.st_dev,
          .inode = status.st_ino,
          .size = static_cast<std::uint64_t>(status.st_size),
          .mode = status.st_mode,
          .modified = {status.st_mtim.tv_sec, status.st_mtim.tv_nsec},
          .changed = {status.st_ctim.tv_sec, status.st_ctim.tv_nsec}};
}

/// What stands under a name of a directory, links not followed; none, with errno set, where that
/// cannot be told.
inline std::optional<FileIdentity> entryIn(int directory, const char* name) {
  struct stat status = {};
  if (::fstatat(directory, name, &status, AT_SYMLINK_NOFOLLOW) == 0) {
    return identityOf(status);
  }
  return errno == ENOENT ? std::optional(FileIdentity()) : std::nullopt;
}

}  // namespace accounts
