#pragma once

#include <sys/types.h>

#include <memory>
#include <string>
#include <utility>

#include "platform/linux/FileDescriptor.h"
#include "platform/linux/PathFailure.h"

namespace accounts {

/// The bits of a mode that are permissions, and the permissions that new files have at first.
inline constexpr mode_t kPermissionBits = 0777;
inline constexpr mode_t kOwnerOnlyFile = 0600;

/// A name in an open directory: where operations on names (creating, removing, renaming) act. No
/// operation here follows a symbolic link at the name itself, so none leaves the directory.
class DirectoryEntry {
 public:
  /// `directory` may be open for its path alone. `name` is one component, neither "." nor "..".
  /// `path` is the device path of the entry, for error texts.
  DirectoryEntry(FileDescriptor directory, std::string name, std::string path)
      : DirectoryEntry(std::make_shared<const FileDescriptor>(std::move(directory)),
                       std::move(name), std::move(path)) {}
  /// The same in a directory that several share.
  DirectoryEntry(std::shared_ptr<const FileDescriptor> directory, std::string name,
                 std::string path);

  [[nodiscard]] int directory() const { return directory_->number(); }
  [[nodiscard]] const char* name() const { return name_.c_str(); }
  [[nodiscard]] const std::string& path() const { return path_; }
  /// Another name in the same directory.
  [[nodiscard]] DirectoryEntry withName(std::string name) const {
    return DirectoryEntry(directory_, std::move(name), path_);
  }

  /// Opens the regular file of this name with open's `flags`, without waiting. A failure when it is
  /// missing, may not be opened or is anything but a regular file.
  [[nodiscard]] OrFailure<FileDescriptor> openRegularFile(int flags) const;

  /// Opens what has this name for its path alone, whatever it is.
  [[nodiscard]] OrFailure<FileDescriptor> openForItsPath() const;

  /// Creates a file of this name with the given permission bits (less the process's mask), open for
  /// reading and writing. A failure when anything exists there or creating fails.
  [[nodiscard]] OrFailure<FileDescriptor> createFile(mode_t permissions) const;

  /// Creates a directory of this name with exactly the given permission bits. After a failure
  /// there is no new directory.
  [[nodiscard]] Result createDirectory(mode_t permissions) const;

  /// Removes the file or symbolic link of this name, never a directory. Returns 0 or the error
  /// number.
  [[nodiscard]] int remove() const;

  /// Opens the directory that holds the name so that it can be flushed; a failure when it may not
  /// be read.
  [[nodiscard]] OrFailure<FileDescriptor> openDirectory() const;

 private:
  std::shared_ptr<const FileDescriptor> directory_;
  std::string name_;
  std::string path_;
};

}  // namespace accounts
