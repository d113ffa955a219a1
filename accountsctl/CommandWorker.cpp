#include "accountsctl/CommandWorker.h"

#include <sys/prctl.h>
#include <sys/socket.h>
#include <sys/wait.h>
#include <unistd.h>

#include <array>
#include <cerrno>
#include <csignal>
#include <cstdlib>
#include <cstring>
#include <utility>

#include "commandline/WorkerChannel.h"
#include "commandline/WorkerEnd.h"
#include "commandline/WorkerLimits.h"

namespace accounts {
namespace {

ProgramError temporaryFailure() {
  return {ExitStatus::TemporaryFailure,
          "No process for the command: " + std::string(std::strerror(errno))};
}

/// A result as a frame has it: whether it is an error, the exit status, and the text.
void send(const FileDescriptor& socket, const CommandResult& result) {
  std::string bytes = {static_cast<char>(!result),
                       static_cast<char>(result ? result->exitStatus : result.error().exitStatus)};
  bytes += result ? result->text : result.error().message;
  // Without a reader there is nobody to tell.
  if (!result || !result->file || sendFrame(socket, FrameKind::Page, *result->file)) {
    static_cast<void>(sendFrame(socket, FrameKind::ToldResult, bytes));
  }
}

CommandResult resultFrom(const std::string& bytes, std::optional<std::string> file) {
  constexpr std::size_t kHeaderSize = 2;
  if (bytes.size() < kHeaderSize) {
    return ProgramError{ExitStatus::PluginEnded, "The command sent no result"};
  }
  const auto exitStatus = static_cast<ExitStatus>(static_cast<unsigned char>(bytes[1]));
  std::string text = bytes.substr(kHeaderSize);
  if (bytes[0] != 0) {
    return ProgramError{exitStatus, std::move(text)};
  }
  return CommandReport{std::move(text), exitStatus, std::move(file)};
}

// noexcept: what is thrown ends this process, not the keeper's own main().
[[noreturn]] void work(const Command& command, const FileDescriptor& socket,
                       pid_t keeper) noexcept {
  tellHowThisWorkerEnds(socket);
  // The keeper may have ended before the request was made.
  prctl(PR_SET_PDEATHSIG, SIGKILL);
  if (getppid() != keeper) {
    _exit(EXIT_FAILURE);
  }
  send(socket, command(CommandWorker(socket)));
  std::exit(EXIT_SUCCESS);
}

int waitFor(pid_t child) {
  int status = 0;
  while (waitpid(child, &status, 0) < 0 && errno == EINTR) {
  }
  return status;
}

/// What a worker says; none when it ended without a word. `limits` are those that it gave itself.
std::optional<CommandResult> receiveResult(const FileDescriptor& socket,
                                           std::optional<ProcessLimits>& limits,
                                           std::string_view who) {
  std::optional<std::string> file;
  for (;;) {
    std::optional<Frame> frame = receiveFrame(socket);
    if (!frame) {
      return std::nullopt;
    }
    ProcessLimits told;
    switch (frame->kind) {
      case FrameKind::Limits:
        std::memcpy(&told, frame->bytes.data(), std::min(frame->bytes.size(), sizeof told));
        limits = told;
        break;
      case FrameKind::Page:
        file = std::move(frame->bytes);
        break;
      case FrameKind::ToldResult:
        return resultFrom(frame->bytes, std::move(file));
      default:
        return WorkerEnd(who, limits)
            .toldBy(*frame)
            .value_or(ProgramError{ExitStatus::PluginEnded, "The command sent something else"});
    }
  }
}

}  // namespace

void CommandWorker::giveUpRights(const OpenInputs& inputs) const {
  Confinement kept = {.descriptors = inputs.descriptors, .limits = workerLimitsFor(inputs.size)};
  kept.descriptors.push_back(socket_.number());
  static_cast<void>(sendFrame(socket_, FrameKind::Limits,
                              {reinterpret_cast<const char*>(&kept.limits), sizeof kept.limits}));
  endUnlessGivenUp(accounts::giveUpRights(kept), socket_);
}

std::string CommandWorker::nextPiece() const {
  std::optional<Frame> frame = receiveFrame(socket_);
  return frame ? std::move(frame->bytes) : std::string();
}

CommandResult runInWorker(const Command& command, const ReadAloud& readAloud,
                          std::string_view who) {
  std::array<int, 2> ends{};
  if (socketpair(AF_UNIX, SOCK_STREAM | SOCK_CLOEXEC, 0, ends.data()) != 0) {
    return temporaryFailure();
  }
  std::optional<FileDescriptor> own(ends[0]);
  std::optional<FileDescriptor> theirs(ends[1]);
  const pid_t keeper = getpid();
  const pid_t child = fork();
  if (child < 0) {
    return temporaryFailure();
  }
  if (child == 0) {
    own.reset();
    work(command, *theirs, keeper);
  }
  theirs.reset();
  OrProgramError<void> heard;
  if (readAloud) {
    heard = readAloud(
        [&own](std::string_view piece) { return sendFrame(*own, FrameKind::Piece, piece); });
  }
  std::optional<ProcessLimits> limits;
  std::optional<CommandResult> result;
  if (heard) {
    result = receiveResult(*own, limits, who);
  }
  // Without a keeper to hear it a worker comes to its end.
  own.reset();
  const int status = waitFor(child);
  if (!heard) {
    return heard.error();
  }
  return result ? *std::move(result) : WorkerEnd(who, limits).withStatus(status);
}

}  // namespace accounts
