#pragma once

#include <cstddef>
#include <memory>
#include <optional>
#include <string>
#include <vector>

#include "host/KernelOwnershipRule.h"
#include "safetynet/MigrationRun.h"
#include "tests/campaign/DeviceProcess.h"

namespace accounts {

/// How a worker hands its result over.
struct Handover {
  enum class Cut : std::uint8_t {
    /// It ends after so many bytes, those of the memory file first.
    WorkerEnds,
    /// It sends the list of changes as if it ended after so many bytes.
    ListIsShort,
    /// It sends a list that is whole, with a memory file of so many bytes.
    MemoryFileIsShort
  };
  struct Limit {
    Cut cut = Cut::WorkerEnds;
    std::size_t bytes = 0;
  };
  std::optional<Limit> limit = {};

  // What was handed over so far, all attempts together.
  /// The contents for the settings file, in order.
  std::vector<std::string> settings = {};
  /// The newest memory file and list.
  std::size_t memoryFileSize = 0;
  std::size_t listSize = 0;
  /// The list as it is sent, with what says how long it is.
  std::size_t frameSize = 0;
  std::size_t attempts = 0;
  /// Why the newest may not be committed; empty when it may.
  std::string error = {};
  /// What the newest foresees that cannot be done.
  std::vector<std::string> warnings = {};
  bool ranOutOfMemory = false;
};

/// The worker without a process of its own: the plug-in in memory, as the host's worker runs it. A
/// want of memory ends it as it ends a process.
class InProcessWorker final : public Worker {
 public:
  /// All must outlive this.
  InProcessWorker(DeviceProcess& device, Handover& handover)
      : device_(device), handover_(handover) {}

  OrProgramError<HandedOver> work(const DeviceSnapshot& snapshot, const WorkerTask& task) override;
  std::unique_ptr<ReadableBytes> contentsOf(const ProposedChange& change) override;

 private:
  [[nodiscard]] Proposal migrate(const DeviceSnapshot& snapshot, const WorkerTask& task);
  OrProgramError<HandedOver> handOver(const Proposal& proposal);

  DeviceProcess& device_;
  Handover& handover_;
  std::string memoryFile_;
};

}  // namespace accounts
