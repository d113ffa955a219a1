#include "host/StopSignals.h"

#include <poll.h>
#include <sys/signalfd.h>

#include <array>
#include <cerrno>
#include <csignal>

namespace accounts {
namespace {

using Clock = std::chrono::steady_clock;

/// Blocks the signals, so that they can be read.
FileDescriptor blockedSignals() {
  sigset_t signals;
  sigemptyset(&signals);
  sigaddset(&signals, SIGTERM);
  sigaddset(&signals, SIGINT);
  sigaddset(&signals, SIGHUP);
  sigprocmask(SIG_BLOCK, &signals, nullptr);
  return FileDescriptor(signalfd(-1, &signals, SFD_CLOEXEC | SFD_NONBLOCK));
}

}  // namespace

StopSignals::StopSignals() : signals_(blockedSignals()) {}

bool StopSignals::haveArrived() {
  pollfd signals = {signals_.number(), POLLIN, 0};
  arrived_ = arrived_ || poll(&signals, 1, 0) > 0;
  return arrived_;
}

bool StopSignals::waitForEither(const FileDescriptor& process, const FileDescriptor& readable) {
  if (haveArrived()) {
    return false;
  }
  std::array<pollfd, 3> events = {pollfd{process.number(), POLLIN, 0},
                                  pollfd{readable.number(), POLLIN, 0},
                                  pollfd{signals_.number(), POLLIN, 0}};
  while (poll(events.data(), events.size(), -1) < 0 && errno == EINTR) {
  }
  const bool isEither = events[0].revents != 0 || events[1].revents != 0;
  arrived_ = arrived_ || !isEither;
  return isEither;
}

bool StopSignals::waitForEndOf(const FileDescriptor& process, std::chrono::milliseconds grace) {
  if (!haveArrived()) {
    std::array<pollfd, 2> events = {pollfd{process.number(), POLLIN, 0},
                                    pollfd{signals_.number(), POLLIN, 0}};
    while (poll(events.data(), events.size(), -1) < 0 && errno == EINTR) {
    }
    if (events[0].revents != 0) {
      return true;
    }
    arrived_ = true;
  }
  const Clock::time_point end = Clock::now() + grace;
  pollfd ended = {process.number(), POLLIN, 0};
  while (true) {
    const auto left = std::chrono::duration_cast<std::chrono::milliseconds>(end - Clock::now());
    const int count = poll(&ended, 1, left.count() > 0 ? static_cast<int>(left.count()) : 0);
    if (count >= 0 || errno != EINTR) {
      return count > 0;
    }
  }
}

}  // namespace accounts
