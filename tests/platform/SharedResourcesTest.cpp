#include <fcntl.h>
#include <gtest/gtest.h>
#include <sys/file.h>
#include <sys/wait.h>
#include <unistd.h>

#include <cerrno>
#include <csignal>

#include "platform/linux/FileDescriptor.h"
#include "platform/linux/LinuxSharedResources.h"
#include "tests/platform/DeviceFixture.h"
#include "tests/platform/WaitingThread.h"

namespace accounts {
namespace {

namespace fs = std::filesystem;

constexpr std::string_view kName = "Migration";
constexpr std::string_view kLockFile = "/tmp/Migration";

class SharedResourcesTest : public DeviceFixture {
 protected:
  SharedResourcesTest() { makeDirectory("/tmp"); }

  // Whether some process holds the lock just now.
  [[nodiscard]] bool isHeld() const {
    const FileDescriptor file(::open(onHost(kLockFile).c_str(), O_RDONLY | O_CLOEXEC));
    return ::flock(file.number(), LOCK_EX | LOCK_NB) != 0 && errno == EWOULDBLOCK;
  }

  DeviceRoot root = openImage();
  LinuxSharedResources resources{root};
};

// Another process that holds the lock of a device from the moment this exists.
class HoldingProcess {
 public:
  explicit HoldingProcess(LinuxSharedResources& resources) {
    int ready[2];
    EXPECT_EQ(::pipe(ready), 0);
    process_ = ::fork();
    if (process_ == 0) {
      const auto lock = resources.makeLock(kName);
      lock->lock();
      (void)!::write(ready[1], "!", 1);
      for (;;) {
        ::pause();
      }
    }
    char byte = 0;
    EXPECT_EQ(::read(ready[0], &byte, 1), 1);
    ::close(ready[0]);
    ::close(ready[1]);
  }
  ~HoldingProcess() { die(); }
  HoldingProcess(const HoldingProcess&) = delete;
  HoldingProcess& operator=(const HoldingProcess&) = delete;

  // Ends the process without giving it a chance to unlock.
  void die() {
    if (process_ > 0) {
      ::kill(process_, SIGKILL);
      ::waitpid(process_, nullptr, 0);
      process_ = -1;
    }
  }

 private:
  pid_t process_ = -1;
};

TEST_F(SharedResourcesTest, TheSystemRootIsTheDeviceRoot) {
  EXPECT_EQ(resources.systemRootDirectory(), "/");
}

TEST_F(SharedResourcesTest, TheSharedDirectoryIsTheMobileUsersOne) {
  EXPECT_EQ(resources.sharedResourcesDirectory(), "/var/mobile");
}

TEST_F(SharedResourcesTest, ANewLockMakesItsFileAndIsNotHeld) {
  const auto lock = resources.makeLock(kName);
  ASSERT_TRUE(lock);
  EXPECT_EQ(contentsOf(kLockFile), "");
  EXPECT_FALSE(isHeld());
}

TEST_F(SharedResourcesTest, OtherUsersCanWaitOnALockWhateverTheMask) {
  const WithMask mask(077);
  ASSERT_TRUE(resources.makeLock(kName));
  EXPECT_EQ(permissionsOf(kLockFile), 0644u);
  fs::permissions(onHost("/tmp"), fs::perms(01777));
  const WithoutPrivileges restricted;
  EXPECT_TRUE(resources.makeLock(kName));
}

TEST_F(SharedResourcesTest, ALockIsHeldUntilItIsUnlocked) {
  const auto lock = resources.makeLock(kName);
  ASSERT_TRUE(lock);
  lock->lock();
  EXPECT_TRUE(isHeld());
  lock->unlock();
  EXPECT_FALSE(isHeld());
}

TEST_F(SharedResourcesTest, ALockIsFreedWhenItsObjectGoes) {
  auto lock = resources.makeLock(kName);
  ASSERT_TRUE(lock);
  lock->lock();
  lock.reset();
  EXPECT_FALSE(isHeld());
}

TEST_F(SharedResourcesTest, TheLockFileStaysAfterUse) {
  auto lock = resources.makeLock(kName);
  ASSERT_TRUE(lock);
  lock->lock();
  lock->unlock();
  lock.reset();
  EXPECT_TRUE(fs::exists(onHost(kLockFile)));
}

TEST_F(SharedResourcesTest, AnExistingLockFileKeepsItsContents) {
  makeFile(kLockFile, "contents");
  const auto lock = resources.makeLock(kName);
  ASSERT_TRUE(lock);
  lock->lock();
  EXPECT_EQ(contentsOf(kLockFile), "contents");
}

TEST_F(SharedResourcesTest, ALockThatAnotherProcessHoldsCanBeMadeAndIsFreedWhenTheHolderDies) {
  HoldingProcess holder(resources);
  const auto lock = resources.makeLock(kName);
  ASSERT_TRUE(lock);
  EXPECT_TRUE(isHeld());
  holder.die();
  lock->lock();
  EXPECT_TRUE(isHeld());
}

TEST_F(SharedResourcesTest, DifferentNamesAreDifferentLocks) {
  HoldingProcess holder(resources);
  const auto other = resources.makeLock("Other");
  ASSERT_TRUE(other);
  other->lock();
  EXPECT_TRUE(isHeld());
}

TEST_F(SharedResourcesTest,
       AFileThatAnotherUserMadeInASharedDirectoryIsALockTooEvenForTheSuperuser) {
  fs::permissions(onHost("/tmp"), fs::perms(01777));
  {
    const WithoutPrivileges restricted;
    ASSERT_TRUE(resources.makeLock(kName));
  }
  EXPECT_TRUE(resources.makeLock(kName));
}

TEST_F(SharedResourcesTest, ALinkInPlaceOfTheLockFileMeansNoLock) {
  makeFile("/target", "contents");
  makeLink(kLockFile, "/target");
  EXPECT_FALSE(resources.makeLock(kName));
}

TEST_F(SharedResourcesTest, ALinkToNothingMeansNoLockAndMakesNothing) {
  makeLink(kLockFile, "/target");
  EXPECT_FALSE(resources.makeLock(kName));
  EXPECT_FALSE(fs::exists(onHost("/target")));
}

TEST_F(SharedResourcesTest, ADirectoryInPlaceOfTheLockFileMeansNoLock) {
  makeDirectory(kLockFile);
  EXPECT_FALSE(resources.makeLock(kName));
}

TEST_F(SharedResourcesTest, ANamedPipeInPlaceOfTheLockFileMeansNoLock) {
  makeNamedPipe(kLockFile);
  EXPECT_FALSE(resources.makeLock(kName));
}

TEST_F(SharedResourcesTest, WithoutItsDirectoryThereIsNoLockAndNoDirectoryIsMade) {
  fs::remove(onHost("/tmp"));
  EXPECT_FALSE(resources.makeLock(kName));
  EXPECT_TRUE(namesIn("/").empty());
}

TEST_F(SharedResourcesTest, ALockFileThatMayNotBeOpenedMeansNoLock) {
  makeFile(kLockFile, "");
  fs::permissions(onHost(kLockFile), fs::perms::none);
  const WithoutPrivileges restricted;
  EXPECT_FALSE(resources.makeLock(kName));
}

TEST_F(SharedResourcesTest, ANameWithASeparatorIsNoLock) {
  makeDirectory("/tmp/directory");
  EXPECT_FALSE(resources.makeLock("directory/Migration"));
  EXPECT_FALSE(resources.makeLock("../Migration"));
  EXPECT_FALSE(resources.makeLock(""));
}

TEST_F(SharedResourcesTest, ASignalDoesNotEndTheWait) {
  HoldingProcess holder(resources);
  const auto lock = resources.makeLock(kName);
  WaitingThread waiter([&] { lock->lock(); });

  waiter.interrupt();

  EXPECT_FALSE(waiter.hasEnded());
  holder.die();
  waiter.join();
  EXPECT_TRUE(isHeld());
}

}  // namespace
}  // namespace accounts
