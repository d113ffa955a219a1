#pragma once

#include <functional>

#include "host/DeviceOptions.h"
#include "host/RunCommand.h"
#include "host/WorkerProcess.h"

namespace accounts {

/// What a worker is given to run the plug-in and to tell of it.
struct PluginWork {
  const RunOptions& options;
  const OpenedDevice& device;
  /// The home directory, a device path.
  std::string home;
  /// Called first, in the worker: forgets what is the host's alone.
  std::function<void()> leaveHost;
  /// Takes what is recorded, line by line, so that what a worker did that ended before its time is
  /// not lost.
  const FileDescriptor& recording;
};

/// Runs the plug-in in memory, hands over what came of it, waits for the outcome and tells of it.
void workInMemory(const PluginWork& work, const WorkerSide& side, const DeviceSnapshot& snapshot,
                  const WorkerTask& task);

/// Tells of a run whose own worker ended before its time, with what was recorded until then. Hands
/// over that nothing is to be changed.
void tellOfEndedWorker(const PluginWork& work, const WorkerSide& side);

/// Runs the plug-in on the device itself; the same otherwise, but that there is nothing to commit.
void workOnDevice(const PluginWork& work, const WorkerSide& side);

}  // namespace accounts
