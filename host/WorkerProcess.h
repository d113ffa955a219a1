#pragma once

#include <sys/types.h>

#include <functional>
#include <memory>
#include <optional>
#include <string>
#include <vector>

#include "commandline/WorkerChannel.h"
#include "host/StopSignals.h"
#include "platform/linux/Confinement.h"
#include "platform/linux/FileDescriptor.h"
#include "safetynet/MigrationRun.h"

namespace accounts {

/// The worker's side of what it shares with the host.
struct WorkerSide {
  const FileDescriptor& socket;
  /// Empty; takes the contents of new files, one behind the other.
  const FileDescriptor& memoryFile;
  /// What stays open for the snapshot, and what the worker may use for that.
  std::vector<int> inputs;
  ProcessLimits limits;
};

/// What runs in the worker's process, from the snapshot to the last frame. It need not return.
using WorkerFunction =
    std::function<void(const WorkerSide& side, const DeviceSnapshot& snapshot, const WorkerTask&)>;

/// What a worker may do. One that can change nothing needs no time to stop.
enum class WorkerRights : std::uint8_t { GivenUp, ThoseOfTheHost };

/// A worker in a process of its own, forked when it is to work, killed when the host ends before
/// it. Its standard output is its standard error, so that nothing that runs there can spoil what
/// the host writes.
class WorkerProcess final : public Worker {
 public:
  /// All but `function` must outlive this.
  WorkerProcess(WorkerFunction function, StopSignals& stop, WorkerRights rights)
      : function_(std::move(function)), stop_(stop), rights_(rights) {}
  WorkerProcess(const WorkerProcess&) = delete;
  WorkerProcess& operator=(const WorkerProcess&) = delete;
  /// Ends the process.
  ~WorkerProcess() override;

  OrProgramError<HandedOver> work(const DeviceSnapshot& snapshot, const WorkerTask& task) override;
  std::unique_ptr<ReadableBytes> contentsOf(const ProposedChange& change) override;

  /// Whether the process is gone, or never was.
  [[nodiscard]] bool hasEnded() const { return child_ <= 0; }
  /// What is to be announced, as the worker handed it over; nothing without.
  [[nodiscard]] const std::string& announcements() const { return announcements_; }

  /// Sends a frame and waits for those that answer it, in order. None when the worker has ended.
  std::optional<std::vector<std::string>> ask(FrameKind kind, std::string_view bytes,
                                              const std::vector<FrameKind>& answers);

 private:
  OrProgramError<void> start(const DeviceSnapshot& snapshot, const WorkerTask& task);
  /// Waits until the worker has sent something or ended; an error when the host is to stop.
  OrProgramError<void> waitForIt();
  /// Waits for the worker's end and says how it ended.
  ProgramError describeEnd();
  /// Takes what the worker made. An error when others could still change it.
  OrProgramError<HandedOver> takeOver(std::string proposal);
  void end();

  WorkerFunction function_;
  StopSignals& stop_;
  WorkerRights rights_;
  std::optional<FileDescriptor> memoryFile_;
  std::optional<FileDescriptor> socket_;
  std::optional<FileDescriptor> process_;
  pid_t child_ = -1;
  /// None for a worker with the rights of the host.
  std::optional<ProcessLimits> limits_;
  /// Whether the worker has said all.
  bool isDone_ = false;
  std::string announcements_;
};

}  // namespace accounts
