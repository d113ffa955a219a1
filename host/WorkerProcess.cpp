#include "host/WorkerProcess.h"

#include <fcntl.h>
#include <poll.h>
#include <sys/mman.h>
#include <sys/prctl.h>
#include <sys/socket.h>
#include <sys/stat.h>
#include <sys/syscall.h>
#include <sys/wait.h>
#include <unistd.h>

#include <array>
#include <cerrno>
#include <csignal>
#include <cstdio>
#include <cstdlib>
#include <cstring>
#include <utility>

#include "commandline/WorkerEnd.h"
#include "commandline/WorkerLimits.h"
#include "platform/linux/OpenInputs.h"
#include "platform/linux/OpenedBytes.h"

namespace accounts {
namespace {

constexpr std::string_view kPlugin = "The plug-in";
// A migration takes far less; one that takes longer waits for something.
constexpr auto kGrace = std::chrono::seconds(5);

/// The system lacks what a process needs; at another time it may have it.
ProgramError temporaryFailure(const std::string& message) {
  return ProgramError{ExitStatus::TemporaryFailure, message + ": " + std::strerror(errno)};
}

// noexcept: an exception of the plug-in ends the worker, not the host's own main().
[[noreturn]] void runChild(const WorkerFunction& function, const WorkerSide& side, pid_t parent,
                           const DeviceSnapshot& snapshot, const WorkerTask& task) noexcept {
  tellHowThisWorkerEnds(side.socket);
  // A migration never goes on unseen: a host that is killed takes its worker along. The parent may
  // have ended before the request was made.
  prctl(PR_SET_PDEATHSIG, SIGKILL);
  if (getppid() != parent) {
    _exit(EXIT_FAILURE);
  }
  dup2(STDERR_FILENO, STDOUT_FILENO);
  // With a buffer of ours the C library does not look at what is behind standard output.
  std::array<char, BUFSIZ> buffer{};
  std::setvbuf(stdout, buffer.data(), _IOLBF, buffer.size());
  function(side, snapshot, task);
  std::exit(EXIT_SUCCESS);
}

}  // namespace

WorkerProcess::~WorkerProcess() {
  end();
}

void WorkerProcess::end() {
  // Without the other end it has nothing left to do; one that is done flushes what it printed.
  socket_.reset();
  if (child_ > 0) {
    if (!isDone_ || !stop_.waitForEndOf(*process_, kGrace)) {
      kill(child_, SIGKILL);
    }
    int status = 0;
    while (waitpid(child_, &status, 0) < 0 && errno == EINTR) {
    }
    child_ = -1;
  }
}

OrProgramError<void> WorkerProcess::start(const DeviceSnapshot& snapshot, const WorkerTask& task) {
  const int memory = memfd_create("migration", MFD_CLOEXEC | MFD_ALLOW_SEALING);
  if (memory < 0) {
    return temporaryFailure("No memory for the migration's result");
  }
  memoryFile_.emplace(memory);
  std::array<int, 2> ends{};
  if (socketpair(AF_UNIX, SOCK_STREAM | SOCK_CLOEXEC, 0, ends.data()) != 0) {
    return temporaryFailure("No connection to the plug-in's process");
  }
  socket_.emplace(ends[0]);
  const FileDescriptor theirs(ends[1]);
  const OpenInputs inputs = openInputsOf(snapshot);
  const ProcessLimits limits = workerLimitsFor(inputs.size);
  if (rights_ == WorkerRights::GivenUp && !kIsExemptFromConfinement) {
    limits_ = limits;
  }
  const pid_t parent = getpid();
  child_ = fork();
  if (child_ == 0) {
    socket_.reset();
    runChild(function_, {theirs, *memoryFile_, inputs.descriptors, limits}, parent, snapshot, task);
  }
  if (child_ < 0) {
    return temporaryFailure("No process for the plug-in");
  }
  const int process = static_cast<int>(syscall(SYS_pidfd_open, child_, 0));
  if (process < 0) {
    return temporaryFailure("The plug-in's process cannot be watched");
  }
  process_.emplace(process);
  return {};
}

OrProgramError<void> WorkerProcess::waitForIt() {
  // Both: a process that the plug-in left behind may hold the socket open.
  if (stop_.waitForEither(*process_, *socket_)) {
    return {};
  }
  const bool endedByItself =
      rights_ == WorkerRights::ThoseOfTheHost && stop_.waitForEndOf(*process_, kGrace);
  if (endedByItself) {
    return {};
  }
  end();
  return ProgramError{ExitStatus::TemporaryFailure,
                      std::string(kStopped) + " before the plug-in was done"};
}

ProgramError WorkerProcess::describeEnd() {
  int status = 0;
  while (waitpid(child_, &status, 0) < 0 && errno == EINTR) {
  }
  child_ = -1;
  return WorkerEnd(kPlugin, limits_).withStatus(status);
}

OrProgramError<HandedOver> WorkerProcess::takeOver(std::string proposal) {
  // From here on nobody changes what the list speaks of.
  struct stat status = {};
  const int seals = F_SEAL_SHRINK | F_SEAL_GROW | F_SEAL_WRITE | F_SEAL_SEAL;
  if (fcntl(memoryFile_->number(), F_ADD_SEALS, seals) != 0 ||
      fstat(memoryFile_->number(), &status) != 0) {
    return temporaryFailure("The migration's result cannot be sealed");
  }
  return HandedOver{std::move(proposal), static_cast<std::uint64_t>(status.st_size)};
}

OrProgramError<HandedOver> WorkerProcess::work(const DeviceSnapshot& snapshot,
                                               const WorkerTask& task) {
  if (const auto started = start(snapshot, task); !started) {
    return started.error();
  }
  for (;;) {
    if (const auto waited = waitForIt(); !waited) {
      return waited.error();
    }
    pollfd readable = {socket_->number(), POLLIN, 0};
    std::optional<Frame> frame = poll(&readable, 1, 0) > 0 && (readable.revents & POLLIN) != 0
                                     ? receiveFrame(*socket_)
                                     : std::nullopt;
    if (!frame) {
      return describeEnd();
    }
    switch (frame->kind) {
      case FrameKind::Announcements:
        announcements_ = std::move(frame->bytes);
        break;
      case FrameKind::Proposal:
        return takeOver(std::move(frame->bytes));
      default:
        return WorkerEnd(kPlugin, limits_)
            .toldBy(*frame)
            .value_or(
                ProgramError{ExitStatus::PluginEnded, "The plug-in's process sent something else"});
    }
  }
}

std::unique_ptr<ReadableBytes> WorkerProcess::contentsOf(const ProposedChange& change) {
  return std::make_unique<PartOfOpenedBytes>(*memoryFile_, change.offset, change.length,
                                             "the migration's result");
}

std::optional<std::vector<std::string>> WorkerProcess::ask(FrameKind kind, std::string_view bytes,
                                                           const std::vector<FrameKind>& answers) {
  if (child_ <= 0 || !socket_ || !sendFrame(*socket_, kind, bytes)) {
    return std::nullopt;
  }
  std::vector<std::string> received;
  for (const FrameKind expected : answers) {
    // A stop signal counts no more: the run is over, and only what is said of it is missing.
    std::optional<Frame> frame = receiveFrame(*socket_);
    if (!frame || frame->kind != expected) {
      return std::nullopt;
    }
    isDone_ = expected == FrameKind::ToldResult;
    received.push_back(std::move(frame->bytes));
  }
  return received;
}

}  // namespace accounts
