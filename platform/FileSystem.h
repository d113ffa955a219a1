#pragma once

#include <cstdint>
#include <optional>
#include <string>
#include <string_view>

#include "platform/Result.h"
#include "propertylist/value/SerializedPropertyList.h"

namespace accounts {

/// The files and directories of the device. All paths are absolute device paths; they never lead
/// out of the device, whatever symbolic links it holds. Failures are reported by the result and
/// leave no half-made file behind unless an operation says otherwise.
class FileSystem {
 public:
  virtual ~FileSystem() = default;

  /// Whether anything exists at a path, symbolic links followed: a link to nothing does not exist.
  virtual bool fileExists(std::string_view path) = 0;
  /// Whether a directory exists at a path, symbolic links followed.
  virtual bool isDirectory(std::string_view path) = 0;
  /// Copies a regular file byte for byte to a path where nothing exists yet.
  virtual Result copyFile(std::string_view source, std::string_view destination) = 0;
  /// Removes a file, or a symbolic link itself. A directory is not removed: that is a failure, like
  /// a missing file.
  virtual Result removeFile(std::string_view path) = 0;
  /// Creates a file with the given contents, replacing a file that exists.
  virtual Result createFile(std::string_view path, std::string_view contents) = 0;
  /// Creates a directory and its missing parents. The directory itself gets exactly the given
  /// permission bits; the parents get the platform's default ones. It is a failure when something
  /// exists at the path.
  virtual Result createDirectoryWithIntermediates(std::string_view path, unsigned permissions) = 0;
  /// Makes a new, empty file with a unique name in the default temporary directory, readable by its
  /// owner alone, and gives its path; none when it cannot be made.
  virtual std::optional<std::string> makeTemporaryFile() = 0;
  /// Writes a property list to a path in place: after a failure the file may hold a part of it.
  virtual Result writeFile(std::string_view path, const SerializedPropertyList& contents) = 0;
  /// Writes a property list to a path so that a reader sees the old file or the whole new one,
  /// never a part.
  virtual Result writeFileAtomically(std::string_view path,
                                     const SerializedPropertyList& contents) = 0;
  /// Gives a file to the user and the group with these account names.
  virtual Result setOwnerAndGroup(std::string_view path, std::string_view ownerName,
                                  std::string_view groupName) = 0;
  /// Moves a file over another path in one step, a file there being replaced. The file's contents
  /// are on the medium before the move is made, and the move is when the operation succeeds.
  virtual Result renameFile(std::string_view source, std::string_view destination) = 0;
};

}  // namespace accounts
