#pragma once

#include <chrono>
#include <string>

#include "platform/linux/FileDescriptor.h"

namespace accounts {

/// The signals that ask the host to stop (SIGTERM and SIGINT). From here to the end of the process
/// they wait until somebody looks, also in child processes, so that a migration is stopped only
/// where that does no harm and its result is always reported.
class StopSignals {
 public:
  StopSignals();

  /// Whether one has arrived. Once true it stays so.
  bool haveArrived();

  /// Waits until a process has ended, for as long as it takes or, from a stop signal on, for as
  /// long as `grace`. Whether the process has ended.
  bool waitForEndOf(const FileDescriptor& process, std::chrono::milliseconds grace);

 private:
  FileDescriptor signals_;
  bool arrived_ = false;
};

/// What is said of a host that was asked to stop.
inline constexpr const char* kStopped = "The host was asked to stop";

}  // namespace accounts
