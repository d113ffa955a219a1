#pragma once

#include <string>
#include <string_view>
#include <vector>

#include "platform/FileIdentity.h"
#include "platform/Result.h"

namespace accounts {

/// What keeping files in folders takes of the files and directories of a device. All paths are
/// absolute device paths, as with FileSystem.
class FileKeeping {
 public:
  virtual ~FileKeeping() = default;

  /// What stands at a path, a symbolic link there not followed. An error when that cannot be told.
  virtual OrFailure<EntryKind> kindOfEntry(std::string_view path) = 0;
  /// The names in a directory, sorted bytewise. An error when it is missing or cannot be read.
  virtual OrFailure<std::vector<std::string>> directoryEntries(std::string_view path) = 0;
  /// The bytes of a regular file, links followed. An error when it is missing, is no such file, has
  /// more than `most` or cannot be read.
  virtual OrFailure<std::string> shortContents(std::string_view path, std::size_t most) = 0;

  /// As with FileSystem.
  virtual Result createFile(std::string_view path, std::string_view contents) = 0;
  virtual Result createDirectoryWithIntermediates(std::string_view path, unsigned permissions) = 0;
  virtual Result removeFile(std::string_view path) = 0;
  /// Removes an empty directory.
  virtual Result removeDirectory(std::string_view path) = 0;
  /// Gives a directory another name in one step; at most an empty directory may exist there. It is
  /// on the medium when the operation succeeds.
  virtual Result renameDirectory(std::string_view source, std::string_view destination) = 0;
  /// Waits until the names in a directory, as they are, are on the medium.
  virtual Result synchronizeDirectory(std::string_view path) = 0;
};

}  // namespace accounts
