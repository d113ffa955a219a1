#include "tests/campaign/InProcessWorker.h"

#include <sys/socket.h>

#include <array>
#include <new>
#include <stdexcept>
#include <utility>

#include "accountsettings/Process.h"
#include "commandline/WorkerChannel.h"
#include "migrator/AccountsDataMigrator.h"
#include "safetynet/MigrationInMemory.h"
#include "tests/campaign/AllocationFailures.h"
#include "transaction/TransactionPlatform.h"

namespace accounts {

namespace {

ProgramError ended() {
  return {ExitStatus::PluginEnded, "The plug-in ended"};
}

/// Part of a text that must outlive this.
class PartOfText final : public ReadableBytes {
 public:
  explicit PartOfText(std::string_view text) : text_(text) {}
  Result giveTo(const Taker& take) const override {
    static_cast<void>(take(text_));
    return {};
  }

 private:
  std::string_view text_;
};

/// The two ends of a connection between a host and its worker.
struct Connection {
  Connection() : host(-1), worker(-1) {
    std::array<int, 2> ends{};
    if (::socketpair(AF_UNIX, SOCK_STREAM | SOCK_CLOEXEC, 0, ends.data()) != 0) {
      throw std::runtime_error("no sockets");
    }
    host = FileDescriptor(ends[0]);
    worker = FileDescriptor(ends[1]);
  }
  FileDescriptor host;
  FileDescriptor worker;
};

/// A frame as it is sent.
std::string frameOf(std::string_view bytes) {
  Connection connection;
  if (!sendFrame(connection.worker, FrameKind::Proposal, bytes)) {
    throw std::runtime_error("the socket takes too little");
  }
  connection.worker = FileDescriptor(-1);
  std::string frame(bytes.size() + 64, '\0');
  const ssize_t count = ::recv(connection.host.number(), frame.data(), frame.size(), MSG_WAITALL);
  frame.resize(static_cast<std::size_t>(std::max(count, ssize_t{0})));
  return frame;
}

/// What the host takes from a worker that ends after having sent some bytes.
std::optional<Frame> frameIn(std::string_view sent) {
  Connection connection;
  if (::send(connection.worker.number(), sent.data(), sent.size(), MSG_NOSIGNAL) !=
      static_cast<ssize_t>(sent.size())) {
    throw std::runtime_error("the socket takes too little");
  }
  connection.worker = FileDescriptor(-1);
  return receiveFrame(connection.host);
}

}  // namespace

OrProgramError<HandedOver> InProcessWorker::work(const DeviceSnapshot& snapshot,
                                                 const WorkerTask& task) {
  ++handover_.attempts;
  try {
    return handOver(migrate(snapshot, task));
  } catch (const std::bad_alloc&) {
    handover_.ranOutOfMemory = true;
    return ended();
  }
}

Proposal InProcessWorker::migrate(const DeviceSnapshot& snapshot, const WorkerTask& task) {
  MigrationInMemory migration(snapshot, kHome);
  KernelOwnershipRule ownership(device_.root);
  TransactionPlatform inMemory(
      migration.transaction(), device_.platform, ownership, task.lock, [](std::string_view path) {
        throw std::logic_error("a path that no migration has: " + std::string(path));
      });
  LinuxPreferenceDomain preferences(inMemory.propertyLists(), device_.homeDirectory);
  Platform platform = inMemory.platform(preferences);
  if (task.purpose == RunPurpose::FinishingAlone) {
    migration.verify(PluginResult::NotAsked, {});
  } else {
    // Each attempt is made by a new process.
    platform.migrationObserver = &migration.told();
    const Process process(platform);
    const bool result = AccountsDataMigrator().performMigration();
    migration.verify(result ? PluginResult::GaveTrue : PluginResult::GaveFalse, factsOf(platform));
  }
  {
    const AllocationsSucceed whileObserving;
    handover_.error = migration.error() ? migration.error()->message : "";
    handover_.warnings = migration.warnings();
  }
  return migration
      .proposal(task.keep,
                [this](std::string_view bytes) {
                  memoryFile_.append(bytes);
                  return true;
                })
      .value();
}

OrProgramError<HandedOver> InProcessWorker::handOver(const Proposal& proposal) {
  const std::string list = bytesOf(proposal);
  const AllocationsSucceed whileObserving;
  handover_.memoryFileSize = memoryFile_.size();
  handover_.listSize = list.size();
  handover_.frameSize = frameOf("").size() + list.size();
  if (const ProposedChange* const settings = proposal.changeOf(DevicePlace::Settings)) {
    handover_.settings.push_back(memoryFile_.substr(settings->offset, settings->length));
  }
  if (!handover_.limit) {
    return HandedOver{list, memoryFile_.size()};
  }
  const auto [cut, bytes] = *handover_.limit;
  switch (cut) {
    case Handover::Cut::WorkerEnds: {
      if (bytes < memoryFile_.size()) {
        return ended();
      }
      const std::optional<Frame> frame =
          frameIn(frameOf(list).substr(0, bytes - memoryFile_.size()));
      return frame ? OrProgramError<HandedOver>({frame->bytes, memoryFile_.size()}) : ended();
    }
    case Handover::Cut::ListIsShort:
      return HandedOver{list.substr(0, bytes), memoryFile_.size()};
    case Handover::Cut::MemoryFileIsShort:
      break;
  }
  memoryFile_.resize(std::min(bytes, memoryFile_.size()));
  return HandedOver{list, memoryFile_.size()};
}

std::unique_ptr<ReadableBytes> InProcessWorker::contentsOf(const ProposedChange& change) {
  return std::make_unique<PartOfText>(
      std::string_view(memoryFile_).substr(change.offset, change.length));
}

}  // namespace accounts
