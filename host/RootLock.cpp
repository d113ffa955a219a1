#include "host/RootLock.h"

#include <fcntl.h>
#include <sys/file.h>
#include <sys/time.h>

#include <cerrno>
#include <csignal>
#include <string>

#include "commandline/PlatformError.h"

namespace accounts {
namespace {

using Clock = std::chrono::steady_clock;

// How often a wait for the lock looks whether it should go on.
constexpr timeval kInterval = {.tv_sec = 0, .tv_usec = 50'000};

/// Interrupts system calls of this process at intervals, as long as it lives.
class Interruptions {
 public:
  Interruptions() {
    struct sigaction action = {};
    action.sa_handler = [](int) {};
    sigaction(SIGALRM, &action, &actionBefore_);
    const itimerval timer = {.it_interval = kInterval, .it_value = kInterval};
    setitimer(ITIMER_REAL, &timer, nullptr);
  }
  Interruptions(const Interruptions&) = delete;
  Interruptions& operator=(const Interruptions&) = delete;
  ~Interruptions() {
    const itimerval none = {};
    setitimer(ITIMER_REAL, &none, nullptr);
    sigaction(SIGALRM, &actionBefore_, nullptr);
  }

 private:
  struct sigaction actionBefore_ = {};
};

ProgramError timeIsUp(std::chrono::seconds timeLimit) {
  return {ExitStatus::TemporaryFailure, "Another host has had the device root for " +
                                            std::to_string(timeLimit.count()) + " seconds"};
}

}  // namespace

std::optional<RootLock> RootLock::take(const DeviceRoot& root,
                                       std::optional<std::chrono::seconds> timeLimit,
                                       StopSignals* stop, ProgramError& error) {
  PathError openError;
  auto directory = root.open("/", O_RDONLY | O_DIRECTORY, openError);
  if (!directory) {
    error = programErrorOf(openError, ExitStatus::CannotCreate);
    return std::nullopt;
  }
  if (::flock(directory->number(), LOCK_EX | LOCK_NB) == 0) {
    return RootLock(std::move(*directory));
  }
  const Clock::time_point start = Clock::now();
  const Interruptions interruptions;
  do {
    if (stop != nullptr && stop->haveArrived()) {
      error = {ExitStatus::TemporaryFailure, kStopped};
      return std::nullopt;
    }
    if (timeLimit && Clock::now() - start >= *timeLimit) {
      error = timeIsUp(*timeLimit);
      return std::nullopt;
    }
    if (::flock(directory->number(), LOCK_EX) == 0) {
      return RootLock(std::move(*directory));
    }
  } while (errno == EINTR);
  error = programErrorOf(pathError("lock", "the device root", errno), ExitStatus::CannotCreate);
  return std::nullopt;
}

RootLock::~RootLock() {
  // Not left to closing: a process that a plug-in left behind has the directory open too. After a
  // move there is nothing to unlock, and that fails without harm.
  ::flock(directory_.number(), LOCK_UN);
}

}  // namespace accounts
