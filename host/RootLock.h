#pragma once

#include <optional>

#include "platform/linux/DeviceRoot.h"
#include "platform/linux/FileDescriptor.h"
#include "platform/linux/PathError.h"

namespace accounts {

/// What keeps hosts on one device root from disturbing each other: a lock (flock) on the root's own
/// directory, so that no file is made for it. It is freed with this object or its process.
class RootLock {
 public:
  /// Takes the lock, waiting while another host has it. None, with `error` set, when the directory
  /// cannot be read or its file system has no such locks.
  static std::optional<RootLock> take(const DeviceRoot& root, PathError& error);

  RootLock(RootLock&&) = default;
  RootLock& operator=(RootLock&&) = delete;
  ~RootLock();

 private:
  explicit RootLock(FileDescriptor directory) : directory_(std::move(directory)) {}

  FileDescriptor directory_;
};

}  // namespace accounts
