#pragma once

#include <chrono>
#include <optional>

#include "commandline/ExitStatus.h"
#include "host/StopSignals.h"
#include "platform/linux/DeviceRoot.h"
#include "platform/linux/FileDescriptor.h"

namespace accounts {

/// What keeps hosts on one device root from disturbing each other: a lock (flock) on the root's own
/// directory, so that no file is made for it. It is freed with this object or its process.
class RootLock {
 public:
  /// Takes the lock, waiting while another host has it: without end, or for as long as `timeLimit`
  /// says, and until a stop signal arrives (null where one ends the process). None, with `error`
  /// set, when it is not obtained: that may pass, unless the directory cannot be read or its file
  /// system has no such locks.
  static std::optional<RootLock> take(const DeviceRoot& root,
                                      std::optional<std::chrono::seconds> timeLimit,
                                      StopSignals* stop, ProgramError& error);

  RootLock(RootLock&&) = default;
  RootLock& operator=(RootLock&&) = delete;
  ~RootLock();

 private:
  explicit RootLock(FileDescriptor directory) : directory_(std::move(directory)) {}

  FileDescriptor directory_;
};

}  // namespace accounts
