#pragma once

#include <optional>
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
  /// Opens the root, given by its path on the host. None, with `error` set, when there is no such
  /// directory or the kernel cannot resolve paths beneath a directory.
  static std::optional<DeviceRoot> openRoot(const std::string& hostDirectory, Failure& error);

  /// Whether this is the root of the running system itself.
  [[nodiscard]] bool isSystemRoot() const { return isSystemRoot_; }

  /// Opens what exists at a device path, with open's `flags` (O_CLOEXEC is added; creating is done
  /// by the DirectoryEntry of `locate`). None, with `error` set, when it cannot be opened.
  [[nodiscard]] std::optional<FileDescriptor> open(std::string_view path, int flags,
                                                   Failure& error) const;

  /// Opens a regular file to read it, symbolic links followed. Anything else is refused at once,
  /// without waiting: none, with `error` set.
  [[nodiscard]] std::optional<FileDescriptor> openRegularFile(std::string_view path,
                                                              Failure& error) const;

  /// The bytes of a regular file, symbolic links followed. None, with `error` set, when it is
  /// missing, unreadable, too large (kLargestFileSize) or no regular file.
  [[nodiscard]] std::optional<std::string> readFile(std::string_view path, Failure& error) const;

  /// Opens the directory of a path, symbolic links in it followed, for an operation on the path's
  /// last name. Nothing needs to exist under that name. None, with `error` set, when the directory
  /// is missing or the path names nothing in a directory.
  [[nodiscard]] std::optional<DirectoryEntry> locate(std::string_view path, Failure& error) const;

 private:
  DeviceRoot(FileDescriptor directory, bool isSystemRoot)
      : directory_(std::move(directory)), isSystemRoot_(isSystemRoot) {}
  [[nodiscard]] std::optional<FileDescriptor> openIfRegular(std::string_view path, int flags,
                                                            Failure& error) const;

  FileDescriptor directory_;
  bool isSystemRoot_;
};

}  // namespace accounts
