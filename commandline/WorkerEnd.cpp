#include "commandline/WorkerEnd.h"

#include <sys/resource.h>
#include <sys/wait.h>
#include <unistd.h>

#include <algorithm>
#include <cerrno>
#include <csignal>
#include <cstdlib>
#include <cstring>
#include <exception>
#include <new>
#include <string>

#include "commandline/MemoryReserve.h"
#include "commandline/WorkerLimits.h"
#include "platform/linux/SystemCallFilter.h"

namespace accounts {
namespace {

/// Handlers are given nothing of their own: where this worker tells of its end.
const FileDescriptor* endSocket = nullptr;

[[noreturn]] void endWith(FrameKind kind, std::string_view bytes) {
  static_cast<void>(sendFrame(*endSocket, kind, bytes));
  _exit(static_cast<int>(ExitStatus::PluginEnded));
}

// Calls nothing that a handler may not call.
void endOnForbiddenCall(int /*signal*/, siginfo_t* information, void* /*context*/) {
  const int number = information->si_syscall;
  endWith(FrameKind::ForbiddenCall, {reinterpret_cast<const char*>(&number), sizeof number});
}

[[noreturn]] void endOnUncaughtException() {
  try {
    if (const std::exception_ptr uncaught = std::current_exception()) {
      std::rethrow_exception(uncaught);
    }
  } catch (const std::bad_alloc&) {
    endWith(FrameKind::OutOfMemory, {});
  } catch (...) {
    std::abort();
  }
  std::abort();
}

std::string allowance(const std::string& amount) {
  return "more than the " + amount + " that files of this size allow it";
}

}  // namespace

void tellHowThisWorkerEnds(const FileDescriptor& socket) {
  endSocket = &socket;
  std::set_terminate(endOnUncaughtException);
  struct sigaction action = {};
  action.sa_sigaction = endOnForbiddenCall;
  action.sa_flags = SA_SIGINFO;
  sigaction(SIGSYS, &action, nullptr);
}

void endUnlessGivenUp(const Result& givenUp, const FileDescriptor& socket) {
  if (givenUp) {
    return;
  }
  if (givenUp.error().number == ENOMEM) {
    throw std::bad_alloc();
  }
  static_cast<void>(sendFrame(socket, FrameKind::Fault, givenUp.error().text));
  _exit(static_cast<int>(ExitStatus::PluginEnded));
}

ProgramError WorkerEnd::error(std::string_view what) const {
  return {ExitStatus::PluginEnded, std::string(who_).append(" ").append(what)};
}

ProgramError WorkerEnd::outOfMemory() const {
  rlimit own = {};
  // A worker keeps a limit of its keeper's that is lower.
  const bool isOfTheWorker =
      limits_ && getrlimit(RLIMIT_AS, &own) == 0 && own.rlim_cur > limits_->memory;
  return isOfTheWorker ? error("needs " + allowance(std::to_string(limits_->memory / kMebibyte) +
                                                    " MiB of memory"))
                       : accounts::outOfMemory();
}

std::optional<ProgramError> WorkerEnd::toldBy(const Frame& frame) const {
  switch (frame.kind) {
    case FrameKind::Fault:
      return ProgramError{ExitStatus::PluginEnded, frame.bytes};
    case FrameKind::ForbiddenCall: {
      int number = -1;
      std::memcpy(&number, frame.bytes.data(), std::min(frame.bytes.size(), sizeof number));
      return error("made a system call that it may not make: " + systemCallName(number));
    }
    case FrameKind::OutOfMemory:
      return outOfMemory();
    default:
      return std::nullopt;
  }
}

ProgramError WorkerEnd::withStatus(int status) const {
  if (!WIFSIGNALED(status)) {
    return error("ended the process with exit status " + std::to_string(WEXITSTATUS(status)));
  }
  const int signalNumber = WTERMSIG(status);
  if (signalNumber == SIGXCPU && limits_) {
    return error("needs " + allowance(std::to_string(limits_->processorTime.count()) +
                                      " s of processor time"));
  }
  return error("ended by signal " + std::to_string(signalNumber) + " (" + strsignal(signalNumber) +
               ")");
}

}  // namespace accounts
