#pragma once

#include <string>
#include <string_view>
#include <utility>

#include "platform/linux/DirectoryEntry.h"
#include "platform/linux/FileDescriptor.h"
#include "platform/linux/PathFailure.h"

namespace accounts {

/// The directory that holds a device: the running system's "/", or an image of a device. Device
/// paths are resolved beneath it by the kernel, symbolic links and ".." included, so no path leads
/// out of it whatever the device holds.
class DeviceRoot {
 public:
  /// Opens the root, given by its path on the host. A failure when there is no such
  /// directory or the kernel cannot resolve paths beneath a directory.
  static OrFailure<DeviceRoot> openRoot(const std::string& hostDirectory);

  /// Whether this is the root of the running system itself.
  [[nodiscard]] bool isSystemRoot() const { return isSystemRoot_; }

  /// Opens what exists at a device path, with open's `flags` (O_CLOEXEC is added; creating is done
  /// by the DirectoryEntry of `locate`).
  [[nodiscard]] OrFailure<FileDescriptor> open(std::string_view path, int flags) const;

  /// Opens a regular file to read it, symbolic links followed. Anything else is refused at once,
  /// without waiting.
  [[nodiscard]] OrFailure<FileDescriptor> openRegularFile(std::string_view path) const;

  /// The bytes of a regular file, symbolic links followed. A failure when it is missing,
  /// unreadable, too large (kLargestFileSize) or no regular file.
  [[nodiscard]] OrFailure<std::string> readFile(std::string_view path) const;

  /// Opens the directory of a path, symbolic links in it followed, for an operation on the path's
  /// last name. Nothing needs to exist under that name. A failure when the directory is
  /// missing or the path names nothing in a directory.
  [[nodiscard]] OrFailure<DirectoryEntry> locate(std::string_view path) const;

 private:
  DeviceRoot(FileDescriptor directory, bool isSystemRoot)
      : directory_(std::move(directory)), isSystemRoot_(isSystemRoot) {}
  [[nodiscard]] OrFailure<FileDescriptor> openIfRegular(std::string_view path, int flags) const;

  FileDescriptor directory_;
  bool isSystemRoot_;
};

}  // namespace accounts
