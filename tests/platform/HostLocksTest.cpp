#include "platform/linux/LinuxHostLocks.h"

#include <fcntl.h>
#include <sys/file.h>
#include <sys/time.h>
#include <sys/wait.h>
#include <unistd.h>

#include <csignal>

#include "tests/platform/DeviceFixture.h"

namespace accounts {
namespace {

namespace fs = std::filesystem;
using std::chrono::seconds;

constexpr const char* kLockFile = "/tmp/AccountMigrationInProgress";

class HostLocksTest : public DeviceFixture {
 protected:
  HostLocksTest() { makeDirectory("/tmp"); }

  /// Takes a lock as another process would: by a descriptor of its own.
  [[nodiscard]] FileDescriptor held(const fs::path& path) const {
    FileDescriptor file(::open(path.c_str(), O_RDONLY | O_CLOEXEC));
    EXPECT_EQ(::flock(file.number(), LOCK_EX | LOCK_NB), 0) << path;
    return file;
  }
  [[nodiscard]] bool isFree(const fs::path& path) const {
    const FileDescriptor file(::open(path.c_str(), O_RDONLY | O_CLOEXEC));
    return ::flock(file.number(), LOCK_EX | LOCK_NB) == 0;
  }

  DeviceRoot root = openImage();
  int questionsBeforeStop = -1;
  std::vector<std::string> told;
  std::optional<LinuxHostLocks> locks{
      std::in_place, root,
      [this] { return questionsBeforeStop >= 0 && questionsBeforeStop-- == 0; },
      [this](std::string_view line) { told.emplace_back(line); }};
};

TEST_F(HostLocksTest, LocksThatAreFreeAreTakenAtOnce) {
  EXPECT_EQ(locks->takeRoot(seconds(0)), LockEnd::Taken);
  EXPECT_EQ(locks->takeMigration(seconds(0)), LockEnd::Taken);
  EXPECT_FALSE(isFree(image()));
  EXPECT_FALSE(isFree(onHost(kLockFile)));
  EXPECT_TRUE(told.empty());
}

TEST_F(HostLocksTest, TheLockOfTheRootLeavesNoFile) {
  ASSERT_EQ(locks->takeRoot(seconds(0)), LockEnd::Taken);
  EXPECT_EQ(namesIn("/"), std::vector<std::string>{"tmp"});
}

TEST_F(HostLocksTest, BothLocksAreGivenBackAtTheEnd) {
  ASSERT_EQ(locks->takeRoot(seconds(0)), LockEnd::Taken);
  ASSERT_EQ(locks->takeMigration(seconds(0)), LockEnd::Taken);
  locks.reset();
  EXPECT_TRUE(isFree(image()));
  EXPECT_TRUE(isFree(onHost(kLockFile)));
}

TEST_F(HostLocksTest, TheMigrationsLockIsGivenBackBeforeTheRoots) {
  ASSERT_EQ(locks->takeRoot(seconds(0)), LockEnd::Taken);
  ASSERT_EQ(locks->takeMigration(seconds(0)), LockEnd::Taken);
  locks->giveMigrationBack();
  EXPECT_TRUE(isFree(onHost(kLockFile)));
  EXPECT_FALSE(isFree(image()));
}

TEST_F(HostLocksTest, AProcessThatWasForkedAndHasForgottenThemHoldsNone) {
  ASSERT_EQ(locks->takeRoot(seconds(0)), LockEnd::Taken);
  ASSERT_EQ(locks->takeMigration(seconds(0)), LockEnd::Taken);
  int ready[2];
  ASSERT_EQ(::pipe(ready), 0);
  const pid_t child = ::fork();
  if (child == 0) {
    locks->closeInChild();
    (void)!::write(ready[1], "!", 1);
    for (;;) {
      ::pause();
    }
  }
  char byte = 0;
  ASSERT_EQ(::read(ready[0], &byte, 1), 1);
  EXPECT_FALSE(isFree(image())) << "what a child forgets is still the parent's";
  locks.reset();
  EXPECT_TRUE(isFree(image()));
  EXPECT_TRUE(isFree(onHost(kLockFile)));
  ::kill(child, SIGKILL);
  ::waitpid(child, nullptr, 0);
}

TEST_F(HostLocksTest, AProcessThatWasLeftBehindWithThemOpenKeepsNone) {
  ASSERT_EQ(locks->takeRoot(seconds(0)), LockEnd::Taken);
  ASSERT_EQ(locks->takeMigration(seconds(0)), LockEnd::Taken);
  const pid_t child = ::fork();
  if (child == 0) {
    for (;;) {
      ::pause();
    }
  }
  locks.reset();
  EXPECT_TRUE(isFree(image()));
  EXPECT_TRUE(isFree(onHost(kLockFile)));
  ::kill(child, SIGKILL);
  ::waitpid(child, nullptr, 0);
}

TEST_F(HostLocksTest, WaitingEndsWhenItsTimeIsUp) {
  const FileDescriptor holder = held(image());
  EXPECT_EQ(locks->takeRoot(seconds(0)), LockEnd::TimeIsUp);
  EXPECT_EQ(locks->reason(), "Another process has had the device root for 0 seconds");
}

TEST_F(HostLocksTest, OneLineSaysWhatIsWaitedForAfterASecond) {
  makeFile(kLockFile, "");
  const FileDescriptor holder = held(onHost(kLockFile));
  const auto start = std::chrono::steady_clock::now();

  EXPECT_EQ(locks->takeMigration(seconds(2)), LockEnd::TimeIsUp);

  const auto waited = std::chrono::steady_clock::now() - start;
  EXPECT_GE(waited, seconds(2));
  EXPECT_LT(waited, seconds(10));
  EXPECT_EQ(told,
            std::vector<std::string>{"Waiting for the migration lock, which another process has"});
  EXPECT_EQ(locks->reason(), "Another process has had the migration lock for 2 seconds");
}

TEST_F(HostLocksTest, AShortWaitIsNotTold) {
  const FileDescriptor holder = held(image());
  questionsBeforeStop = 3;
  EXPECT_EQ(locks->takeRoot(std::nullopt), LockEnd::Stopped);
  EXPECT_TRUE(told.empty());
}

TEST_F(HostLocksTest, AWaitWithoutALimitEndsWhenTheProcessIsToStop) {
  const FileDescriptor holder = held(image());
  questionsBeforeStop = 5;
  EXPECT_EQ(locks->takeRoot(std::nullopt), LockEnd::Stopped);
}

TEST_F(HostLocksTest, ALockIsTakenAsSoonAsItsHolderEnds) {
  makeFile(kLockFile, "");
  int ready[2];
  ASSERT_EQ(::pipe(ready), 0);
  const pid_t holder = ::fork();
  if (holder == 0) {
    const FileDescriptor file(::open(onHost(kLockFile).c_str(), O_RDONLY));
    ::flock(file.number(), LOCK_EX);
    (void)!::write(ready[1], "!", 1);
    ::usleep(200'000);
    ::_exit(0);
  }
  char byte = 0;
  ASSERT_EQ(::read(ready[0], &byte, 1), 1);
  EXPECT_EQ(locks->takeMigration(std::nullopt), LockEnd::Taken);
  EXPECT_FALSE(isFree(onHost(kLockFile)));
  ::waitpid(holder, nullptr, 0);
}

TEST_F(HostLocksTest, WaitingLeavesNoTimerAndNoSignalHandler) {
  const FileDescriptor holder = held(image());
  ASSERT_EQ(locks->takeRoot(seconds(0)), LockEnd::TimeIsUp);
  itimerval timer = {};
  struct sigaction action = {};
  ASSERT_EQ(::getitimer(ITIMER_REAL, &timer), 0);
  ASSERT_EQ(::sigaction(SIGALRM, nullptr, &action), 0);
  EXPECT_EQ(timer.it_value.tv_usec, 0);
  EXPECT_EQ(timer.it_interval.tv_usec, 0);
  EXPECT_EQ(action.sa_handler, SIG_DFL);
}

TEST_F(HostLocksTest, WithoutADirectoryOrWithALinkForItsFileThereIsNoMigrationLock) {
  fs::remove(onHost("/tmp"));
  EXPECT_FALSE(locks->canTakeMigration());
  EXPECT_EQ(locks->takeMigration(seconds(0)), LockEnd::Impossible);
  EXPECT_EQ(locks->reason(), "Cannot open /tmp: No such file or directory");
  EXPECT_TRUE(namesIn("/").empty());

  makeDirectory("/tmp");
  makeLink(kLockFile, "/somewhere");
  EXPECT_FALSE(locks->canTakeMigration());
  EXPECT_EQ(locks->takeMigration(seconds(0)), LockEnd::Impossible);
  EXPECT_EQ(namesIn("/"), std::vector<std::string>{"tmp"});
}

TEST_F(HostLocksTest, WhetherALockCanBeMadeIsToldWithoutMakingIt) {
  EXPECT_TRUE(locks->canTakeMigration());
  EXPECT_TRUE(namesIn("/tmp").empty());
  makeFile(kLockFile, "");
  EXPECT_TRUE(locks->canTakeMigration());
}

TEST_F(HostLocksTest, InADirectoryThatMayNotBeWrittenALockIsNotMadeButTaken) {
  fs::permissions(onHost("/tmp"), fs::perms(0555));
  {
    const WithoutPrivileges everyone;
    EXPECT_FALSE(locks->canTakeMigration());
    EXPECT_EQ(locks->takeMigration(seconds(0)), LockEnd::Impossible);
  }
  makeFile(kLockFile, "");
  fs::permissions(onHost(kLockFile), fs::perms(0644));
  const WithoutPrivileges everyone;
  EXPECT_TRUE(locks->canTakeMigration());
  EXPECT_EQ(locks->takeMigration(seconds(0)), LockEnd::Taken);
}

}  // namespace
}  // namespace accounts
