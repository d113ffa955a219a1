#include "platform/linux/LinuxHostLocks.h"

#include <fcntl.h>
#include <sys/file.h>
#include <sys/time.h>

#include <cerrno>
#include <csignal>

#include "platform/linux/LinuxSharedResources.h"
#include "vocabulary/DevicePath.h"
#include "vocabulary/DevicePlaces.h"

namespace accounts {
namespace {

using Clock = std::chrono::steady_clock;

// How often a wait for a lock looks whether it should go on.
constexpr timeval kInterval = {.tv_sec = 0, .tv_usec = 50'000};

constexpr std::chrono::seconds kPatience(1);

/// How an attempt ended that failed with this number.
LockEnd endWith(int number) {
  return number == EMFILE || number == ENFILE || number == ENOMEM ? LockEnd::Wanting
                                                                  : LockEnd::Impossible;
}

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

}  // namespace

LinuxHostLocks::~LinuxHostLocks() {
  // Not left to closing: a process that a plug-in left behind may have the files open too.
  giveMigrationBack();
  if (directory_) {
    ::flock(directory_->number(), LOCK_UN);
  }
}

LockEnd LinuxHostLocks::wait(const FileDescriptor& file, std::string_view what,
                             std::optional<std::chrono::seconds> timeLimit) {
  if (::flock(file.number(), LOCK_EX | LOCK_NB) == 0) {
    return LockEnd::Taken;
  }
  if (errno != EWOULDBLOCK && errno != EINTR) {
    reason_ = pathFailure("lock", what, errno).text;
    return LockEnd::Impossible;
  }
  const Clock::time_point start = Clock::now();
  const Interruptions interruptions;
  bool isTold = false;
  for (;;) {
    if (isStopped_()) {
      return LockEnd::Stopped;
    }
    const Clock::duration waited = Clock::now() - start;
    if (timeLimit && waited >= *timeLimit) {
      reason_ = std::string("Another process has had ")
                    .append(what)
                    .append(" for " + std::to_string(timeLimit->count()) + " seconds");
      return LockEnd::TimeIsUp;
    }
    if (!isTold && waited >= kPatience) {
      isTold = true;
      tell_(std::string("Waiting for ").append(what).append(", which another process has"));
    }
    if (::flock(file.number(), LOCK_EX) == 0) {
      return LockEnd::Taken;
    }
    if (errno != EINTR) {
      reason_ = pathFailure("lock", what, errno).text;
      return LockEnd::Impossible;
    }
  }
}

LockEnd LinuxHostLocks::takeRoot(std::optional<std::chrono::seconds> timeLimit) {
  auto directory = root_.open("/", O_RDONLY | O_DIRECTORY);
  if (!directory) {
    reason_ = directory.error().text;
    return endWith(directory.error().number);
  }
  directory_ = *std::move(directory);
  return wait(*directory_, "the device root", timeLimit);
}

LockEnd LinuxHostLocks::takeMigration(std::optional<std::chrono::seconds> timeLimit) {
  auto file = openLockFile(root_, kMigrationLockName);
  if (!file) {
    reason_ = file.error().text;
    return endWith(file.error().number);
  }
  migration_ = *std::move(file);
  const LockEnd end = wait(*migration_, "the migration lock", timeLimit);
  if (end != LockEnd::Taken) {
    migration_.reset();
  }
  return end;
}

bool LinuxHostLocks::canTakeMigration() {
  const auto entry = root_.locate(joinedPath(kLockDirectory, kMigrationLockName));
  auto file = entry ? entry->openRegularFile(O_RDONLY) : entry.error();
  if (file) {
    return true;
  }
  // A mount that may only be read does not count: a run is made on one that may be written.
  if (entry && file.error().number == ENOENT) {
    if (::faccessat(entry->directory(), ".", W_OK | X_OK, AT_EACCESS) == 0 || errno == EROFS) {
      return true;
    }
    file = pathFailure("create", entry->path(), errno);
  }
  reason_ = file.error().text;
  return false;
}

void LinuxHostLocks::giveMigrationBack() {
  if (migration_) {
    ::flock(migration_->number(), LOCK_UN);
    migration_.reset();
  }
}

void LinuxHostLocks::closeInChild() {
  directory_.reset();
  migration_.reset();
}

}  // namespace accounts
