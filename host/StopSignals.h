#pragma once

#include <chrono>
#include <string>

#include "platform/linux/FileDescriptor.h"

namespace accounts {

/// The signals that ask the host to stop (SIGTERM, SIGINT and SIGHUP). From here to the end of the
/// process they wait until somebody looks, also in child processes, so that a migration is stopped
/// only where that does no harm and its result is always reported.
class StopSignals {
 public:
  StopSignals();

  /// Whether one has arrived. Once true it stays so.
  bool haveArrived();

  /// Waits until a process has ended or a descriptor can be read; false when a stop signal comes
  /// first.
  bool waitForEither(const FileDescriptor& process, const FileDescriptor& readable);

  /// Waits until a process has ended, for as long as it takes or, from a stop signal on, for as
  /// long as `grace`. Whether the process has ended.
  bool waitForEndOf(const FileDescriptor& process, std::chrono::milliseconds grace);

 private:
  FileDescriptor signals_;
  bool arrived_ = false;
};

}  // namespace accounts
