#pragma once

#include <chrono>
#include <cstdint>
#include <functional>
#include <memory>
#include <optional>
#include <string>
#include <string_view>
#include <vector>

#include "commandline/ExitStatus.h"
#include "platform/DevicePlaces.h"
#include "platform/FileKeeping.h"
#include "platform/HostLocks.h"
#include "safetynet/KeptFolders.h"
#include "safetynet/MigrationInMemory.h"
#include "safetynet/Proposal.h"
#include "transaction/TransactionSharedResources.h"

namespace accounts {

/// What a run is made for.
enum class RunPurpose : std::uint8_t {
  Migration,
  /// Nothing is committed.
  Plan,
  /// Only what an interrupted commit left is finished; the plug-in is not asked.
  FinishingAlone
};

/// What a worker is to do with a snapshot.
struct WorkerTask {
  RunPurpose purpose = RunPurpose::Migration;
  MigrationLockState lock = MigrationLockState::Available;
  KeepFiles keep = KeepFiles::WhenNeeded;
};

/// What a worker handed over: a proposal as bytes and the size of the memory file beside it.
struct HandedOver {
  std::string proposal;
  std::uint64_t memoryFileSize = 0;
};

/// Makes one migration in memory. Only it looks into files.
class Worker {
 public:
  virtual ~Worker() = default;

  /// Migrates in memory and hands over. An error when it ended before it had, or could not begin.
  virtual OrProgramError<HandedOver> work(const DeviceSnapshot& snapshot,
                                          const WorkerTask& task) = 0;
  /// The contents of a change, in the memory file.
  virtual std::unique_ptr<ReadableBytes> contentsOf(const ProposedChange& change) = 0;
};

/// What a run came to, for whoever tells people.
struct RunConclusion {
  /// That of the proposal, unless there is an error.
  ExitStatus exitStatus = ExitStatus::Success;
  /// Why nothing was changed; none where that is for the worker to say.
  std::optional<ProgramError> error;
  /// What happened beside, one sentence each without a full stop.
  std::vector<std::string> warnings;
  /// The folder of this run's kept files, and those of earlier ones, oldest first.
  std::optional<std::string> keptFolder;
  std::vector<std::string> earlierFolders;
  /// Whether the changes are made, so that they may be announced.
  bool isCommitted = false;
};

/// What a run needs of the device and of the host.
struct RunMeans {
  HostLocks& locks;
  DevicePlaces& places;
  FileKeeping& files;
  /// Makes the worker of an attempt.
  std::function<std::unique_ptr<Worker>()> makeWorker;
  /// Whether the host was asked to stop.
  std::function<bool()> isStopped;
  /// Tells people of an attempt that is given up.
  std::function<void(std::string_view)> tell;
  /// Sortable text for the names of folders.
  std::string time;
  std::optional<std::chrono::seconds> lockTimeout;
};

/// One run, from the locks to the end of the commit. Until the commit nothing on the device is
/// changed, but that what killed runs left is cleared away.
class MigrationRun {
 public:
  /// `means` must outlive this.
  explicit MigrationRun(RunMeans& means) : means_(means), folders_(means.files, means.places) {}

  RunConclusion run(RunPurpose purpose, KeepFiles keep);
  /// The worker of the last attempt, which knows what it did; null when none was made.
  [[nodiscard]] Worker* worker() const { return worker_.get(); }

 private:
  enum class Attempt : std::uint8_t { Over, GivenUp };

  OrProgramError<void> takeLocks(RunPurpose purpose);
  Attempt attempt(RunPurpose purpose, KeepFiles keep);
  Attempt commit(const DeviceSnapshot& snapshot, const Proposal& proposal);
  Attempt fail(ProgramError error);

  RunMeans& means_;
  KeptFolders folders_;
  MigrationLockState lock_ = MigrationLockState::Available;
  std::unique_ptr<Worker> worker_;
  RunConclusion conclusion_;
};

/// The error that a lock which was not taken is.
ProgramError lockErrorOf(LockEnd end, const HostLocks& locks);

/// What is said of a host that was asked to stop.
inline constexpr const char* kStopped = "The host was asked to stop";

}  // namespace accounts
