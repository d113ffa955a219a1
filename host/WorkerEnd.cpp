#include "host/WorkerEnd.h"

#include <sys/resource.h>
#include <sys/wait.h>
#include <unistd.h>

#include <algorithm>
#include <csignal>
#include <cstdlib>
#include <cstring>
#include <exception>
#include <new>
#include <string>
#include <utility>

#include "host/WorkerChannel.h"
#include "platform/linux/SystemCallFilter.h"

namespace accounts {
namespace {

constexpr std::uint64_t kMebibyte = std::uint64_t{1} << 20;

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

ProgramError pluginEnded(std::string message) {
  return {ExitStatus::PluginEnded, "The plug-in " + std::move(message)};
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

ProgramError forbiddenCallError(std::string_view bytes) {
  int number = -1;
  std::memcpy(&number, bytes.data(), std::min(bytes.size(), sizeof number));
  return pluginEnded("made a system call that it may not make: " + systemCallName(number));
}

ProgramError outOfMemoryError(const std::optional<ProcessLimits>& limits) {
  rlimit host = {};
  // A worker keeps a limit of the host's that is lower.
  const bool isOwnLimit =
      limits && getrlimit(RLIMIT_AS, &host) == 0 && host.rlim_cur > limits->memory;
  return isOwnLimit ? pluginEnded("needs " + allowance(std::to_string(limits->memory / kMebibyte) +
                                                       " MiB of memory"))
                    : ProgramError{ExitStatus::TemporaryFailure, "No memory for the migration"};
}

ProgramError endedWorkerError(int status, const std::optional<ProcessLimits>& limits) {
  if (!WIFSIGNALED(status)) {
    return pluginEnded("ended the process with exit status " + std::to_string(WEXITSTATUS(status)));
  }
  const int signalNumber = WTERMSIG(status);
  if (signalNumber == SIGXCPU && limits) {
    return pluginEnded("needs " + allowance(std::to_string(limits->processorTime.count()) +
                                            " s of processor time"));
  }
  return pluginEnded("ended by signal " + std::to_string(signalNumber) + " (" +
                     strsignal(signalNumber) + ")");
}

}  // namespace accounts
