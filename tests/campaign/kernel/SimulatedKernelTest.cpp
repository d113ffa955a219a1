#include "tests/campaign/SimulatedKernel.h"

#include <fcntl.h>
#include <gtest/gtest.h>
#include <linux/fs.h>
#include <sys/file.h>
#include <unistd.h>

#include <cerrno>
#include <stdexcept>

namespace accounts {
namespace {

SimulatedDisk diskWithFiles() {
  SimulatedDisk disk;
  disk.addFile("/home/one", "first");
  disk.addFile("/home/other", "second");
  disk.addDirectory("/home/directory");
  return disk;
}

class SimulatedKernelTest : public testing::Test {
 protected:
  explicit SimulatedKernelTest(const FileSystemAbilities& abilities = {}) {
    kernel.setAbilities(abilities);
    kernel.start({}, SimulatedKernel::Recording::On);
  }

  int open(std::string_view name, int flags = O_RDWR) {
    return kernel.openAt(home, name, flags, 0600);
  }
  int rename(std::string_view name, std::string_view newName, unsigned flags) {
    return kernel.rename(home, name, home, newName, flags);
  }
  struct stat statusOf(std::string_view name) {
    struct stat status = {};
    EXPECT_EQ(kernel.statusAt(home, name, status, 0), 0) << name;
    return status;
  }
  /// The nanoseconds of a time, of which the seconds are those of all times here.
  static long modified(const struct stat& status) { return status.st_mtim.tv_nsec; }
  static long changed(const struct stat& status) { return status.st_ctim.tv_nsec; }
  std::string contentsOf(std::string_view name) {
    return kernel.disk().contentsOf("/home/" + std::string(name)).value_or("nothing");
  }

  SimulatedKernel kernel{diskWithFiles(), 1};
  int home = kernel.openBeneath("/home", O_PATH | O_DIRECTORY);
};

TEST_F(SimulatedKernelTest, AnExchangeIsOneChangeThatSwapsTwoFiles) {
  const ino_t one = statusOf("one").st_ino;
  const std::size_t changesBefore = kernel.changes().size();

  EXPECT_EQ(rename("one", "other", RENAME_EXCHANGE), 0);

  EXPECT_EQ(kernel.changes().size(), changesBefore + 1);
  EXPECT_EQ(contentsOf("one"), "second");
  EXPECT_EQ(contentsOf("other"), "first");
  EXPECT_EQ(statusOf("other").st_ino, one);
  EXPECT_EQ(statusOf("one").st_nlink, 1U);
  EXPECT_EQ(statusOf("other").st_nlink, 1U);
}

TEST_F(SimulatedKernelTest, AnExchangeNeedsBothNames) {
  EXPECT_EQ(rename("one", "missing", RENAME_EXCHANGE), -ENOENT);
  EXPECT_EQ(rename("missing", "one", RENAME_EXCHANGE), -ENOENT);
  EXPECT_EQ(contentsOf("one"), "first");
}

TEST_F(SimulatedKernelTest, ARenameThatSparesFindsANameThatIsThere) {
  EXPECT_EQ(rename("one", "other", RENAME_NOREPLACE), -EEXIST);
  EXPECT_EQ(contentsOf("other"), "second");
  EXPECT_EQ(rename("one", "new", RENAME_NOREPLACE), 0);
  EXPECT_EQ(contentsOf("new"), "first");
  EXPECT_EQ(contentsOf("one"), "nothing");
}

TEST_F(SimulatedKernelTest, ARenameReplacesAFileThatLosesItsName) {
  const int replaced = open("other");

  EXPECT_EQ(rename("one", "other", 0), 0);

  struct stat status = {};
  ASSERT_EQ(kernel.status(replaced, status), 0);
  EXPECT_EQ(status.st_nlink, 0U);
  EXPECT_EQ(contentsOf("other"), "first");
}

TEST_F(SimulatedKernelTest, ARenameOfOneFileToItsOtherNameDoesNothing) {
  ASSERT_EQ(kernel.link(home, "one", home, "second name", 0), 0);

  EXPECT_EQ(rename("one", "second name", 0), 0);

  EXPECT_EQ(contentsOf("one"), "first");
  EXPECT_EQ(statusOf("second name").st_nlink, 2U);
}

TEST_F(SimulatedKernelTest, AFileCountsItsNames) {
  ASSERT_EQ(kernel.link(home, "one", home, "second name", 0), 0);
  EXPECT_EQ(statusOf("one").st_nlink, 2U);
  EXPECT_EQ(statusOf("one").st_ino, statusOf("second name").st_ino);

  ASSERT_EQ(kernel.unlink(home, "one", 0), 0);
  EXPECT_EQ(statusOf("second name").st_nlink, 1U);
}

TEST_F(SimulatedKernelTest, AnOpenFileOutlivesItsLastName) {
  const int file = open("one");

  ASSERT_EQ(kernel.unlink(home, "one", 0), 0);

  char bytes[8] = {};
  EXPECT_EQ(kernel.readAt(file, bytes, sizeof bytes, 1), 4);
  EXPECT_STREQ(bytes, "irst");
  EXPECT_EQ(kernel.link(file, "", home, "back", AT_EMPTY_PATH), -ENOENT);
}

TEST_F(SimulatedKernelTest, ANewFileGetsTheNumberOfOneThatIsGone) {
  const ino_t number = statusOf("one").st_ino;
  ASSERT_EQ(kernel.unlink(home, "one", 0), 0);

  ASSERT_GE(open("new", O_RDWR | O_CREAT | O_EXCL), 0);

  EXPECT_EQ(statusOf("new").st_ino, number);
}

TEST_F(SimulatedKernelTest, AnOpenFileKeepsItsNumber) {
  const ino_t number = statusOf("one").st_ino;
  const int file = open("one");
  ASSERT_EQ(kernel.unlink(home, "one", 0), 0);

  ASSERT_GE(open("new", O_RDWR | O_CREAT | O_EXCL), 0);
  EXPECT_NE(statusOf("new").st_ino, number);

  ASSERT_EQ(kernel.close(file), 0);
  ASSERT_GE(open("newer", O_RDWR | O_CREAT | O_EXCL), 0);
  EXPECT_EQ(statusOf("newer").st_ino, number);
}

TEST_F(SimulatedKernelTest, AnOpenFileGetsAnotherName) {
  const int file = open("one", O_RDONLY);

  EXPECT_EQ(kernel.link(file, "", home, "second name", AT_EMPTY_PATH), 0);

  EXPECT_EQ(contentsOf("second name"), "first");
}

TEST_F(SimulatedKernelTest, WritingModifiesAndChanges) {
  const struct stat before = statusOf("one");

  ASSERT_EQ(kernel.writeAt(open("one"), "F", 0), 1);

  EXPECT_EQ(contentsOf("one"), "First");
  EXPECT_GT(modified(statusOf("one")), modified(before));
  EXPECT_EQ(changed(statusOf("one")), modified(statusOf("one")));
}

TEST_F(SimulatedKernelTest, PermissionsOwnersAndNamesChangeWithoutModifying) {
  const struct stat before = statusOf("one");
  long changedLast = changed(before);
  const auto hasChangedOnly = [&](std::string_view name) {
    const struct stat now = statusOf(name);
    const bool isLater = changed(now) > changedLast;
    changedLast = changed(now);
    return isLater && modified(now) == modified(before);
  };

  ASSERT_EQ(kernel.setPermissions(open("one"), 0640), 0);
  EXPECT_TRUE(hasChangedOnly("one"));
  ASSERT_EQ(kernel.setOwner(open("one"), 501, static_cast<unsigned>(-1)), 0);
  EXPECT_TRUE(hasChangedOnly("one"));
  ASSERT_EQ(kernel.link(home, "one", home, "second name", 0), 0);
  EXPECT_TRUE(hasChangedOnly("one"));
  ASSERT_EQ(rename("one", "other", RENAME_EXCHANGE), 0);
  EXPECT_TRUE(hasChangedOnly("other"));
  ASSERT_EQ(kernel.unlink(home, "second name", 0), 0);
  EXPECT_TRUE(hasChangedOnly("other"));
  EXPECT_EQ(statusOf("other").st_uid, 501U);
  EXPECT_EQ(statusOf("other").st_gid, 0U);
  EXPECT_EQ(statusOf("other").st_mode, mode_t{S_IFREG | 0640});
}

TEST_F(SimulatedKernelTest, AChangeOfNamesModifiesTheirDirectory) {
  const long before = modified(statusOf("."));

  ASSERT_EQ(kernel.unlink(home, "one", 0), 0);

  EXPECT_GT(modified(statusOf(".")), before);
}

TEST_F(SimulatedKernelTest, TimesAreSetLeftOrNow) {
  const timespec set[] = {{}, {.tv_sec = 86'400, .tv_nsec = 7}};
  const timespec left[] = {{.tv_sec = 1, .tv_nsec = 0}, {.tv_sec = 0, .tv_nsec = UTIME_OMIT}};
  const timespec now[] = {{.tv_sec = 0, .tv_nsec = UTIME_OMIT},
                          {.tv_sec = 0, .tv_nsec = UTIME_NOW}};
  const int file = open("one");

  ASSERT_EQ(kernel.setTimes(file, set), 0);
  ASSERT_EQ(kernel.setTimes(file, left), 0);
  EXPECT_EQ(statusOf("one").st_mtim.tv_sec, 86'400);
  EXPECT_EQ(statusOf("one").st_mtim.tv_nsec, 7);
  ASSERT_EQ(kernel.setTimes(file, now), 0);
  EXPECT_EQ(statusOf("one").st_mtim.tv_sec, statusOf("one").st_ctim.tv_sec);
  EXPECT_EQ(modified(statusOf("one")), changed(statusOf("one")));
}

TEST_F(SimulatedKernelTest, AnImmutableFileKeepsItsNameAndContents) {
  SimulatedDisk disk = diskWithFiles();
  disk.setImmutable("/home/one", true);
  SimulatedKernel another(disk, 1);
  const int directory = another.openBeneath("/home", O_PATH | O_DIRECTORY);
  const int file = another.openAt(directory, "one", O_RDONLY, 0);

  EXPECT_EQ(another.openAt(directory, "one", O_RDWR, 0), -EPERM);
  EXPECT_EQ(another.access(directory, "one", W_OK, 0), -EPERM);
  EXPECT_EQ(another.access(directory, "one", R_OK, 0), 0);
  EXPECT_EQ(another.unlink(directory, "one", 0), -EPERM);
  EXPECT_EQ(another.rename(directory, "one", directory, "new", 0), -EPERM);
  EXPECT_EQ(another.rename(directory, "other", directory, "one", RENAME_EXCHANGE), -EPERM);
  EXPECT_EQ(another.link(directory, "one", directory, "new", 0), -EPERM);
  EXPECT_EQ(another.setPermissions(file, 0600), -EPERM);
  int flags = 0;
  EXPECT_EQ(another.flags(file, flags), 0);
  EXPECT_EQ(flags, FS_IMMUTABLE_FL);
}

TEST_F(SimulatedKernelTest, AnImmutableDirectoryKeepsItsNames) {
  SimulatedDisk disk = diskWithFiles();
  disk.setImmutable("/home", true);
  SimulatedKernel another(disk, 1);
  const int directory = another.openBeneath("/home", O_PATH | O_DIRECTORY);

  EXPECT_EQ(another.openAt(directory, "new", O_RDWR | O_CREAT, 0600), -EPERM);
  EXPECT_EQ(another.makeDirectory(directory, "new", 0700), -EPERM);
  EXPECT_EQ(another.unlink(directory, "one", 0), -EPERM);
  EXPECT_GE(another.openAt(directory, "one", O_RDWR, 0), SimulatedKernel::kFirstDescriptor);
}

TEST_F(SimulatedKernelTest, WhatIsOpenForItsPathAloneIsOnlyLookedAt) {
  const int file = open("one", O_PATH);
  char byte = 0;
  struct stat status = {};

  EXPECT_EQ(kernel.read(file, &byte, 1), -EBADF);
  EXPECT_EQ(kernel.synchronize("fsync", file), -EBADF);
  EXPECT_EQ(kernel.statusAt(file, "", status, AT_EMPTY_PATH), 0);
  EXPECT_EQ(status.st_size, 5);
}

TEST_F(SimulatedKernelTest, WhatIsOpenForReadingIsNotWritten) {
  EXPECT_EQ(kernel.write(open("one", O_RDONLY), "x"), -EBADF);
  EXPECT_EQ(contentsOf("one"), "first");
}

TEST_F(SimulatedKernelTest, AnotherProcessGivesALockBackAfterSoManyCalls) {
  const int file = open("one");
  kernel.lockByAnother(
      {"/home/one", 2, [](OtherProgram& program) { program.replace("/home/other", "third"); }});

  EXPECT_EQ(kernel.lock(file, LOCK_EX | LOCK_NB), -EWOULDBLOCK);
  EXPECT_EQ(kernel.lock(file, LOCK_EX), -EINTR);
  EXPECT_EQ(contentsOf("other"), "second");
  EXPECT_EQ(kernel.lock(file, LOCK_EX), 0);
  EXPECT_EQ(contentsOf("other"), "third");
}

TEST_F(SimulatedKernelTest, WhoWaitsForEverIsToldSo) {
  const int file = open("one");
  kernel.lockByAnother({.path = "/home/one", .count = SimulatedKernel::kNever});

  const auto wait = [&] {
    while (kernel.lock(file, LOCK_EX) != 0) {
    }
  };
  EXPECT_THROW(wait(), std::logic_error);
}

TEST_F(SimulatedKernelTest, AnotherProgramActsJustBeforeACall) {
  kernel.start({}, SimulatedKernel::Recording::On);
  kernel.intrude(
      {.operation = 1, .act = [](OtherProgram& program) { program.remove("/home/one"); }});

  EXPECT_EQ(statusOf("one").st_size, 5);
  struct stat status = {};
  EXPECT_EQ(kernel.statusAt(home, "one", status, 0), -ENOENT);
}

TEST_F(SimulatedKernelTest, AnotherProgramActsAgainAndAgain) {
  kernel.start({}, SimulatedKernel::Recording::On);
  int count = 0;
  kernel.intrude({.operation = 1, .count = 2, .act = [&](OtherProgram&) { ++count; }});

  for (int call = 0; call < 5; ++call) {
    statusOf("one");
  }
  EXPECT_EQ(count, 2);
}

TEST_F(SimulatedKernelTest, TheChangesOfARunMadeAgainGiveTheSameDisk) {
  SimulatedDisk again = diskWithFiles();
  const int file = open("new", O_RDWR | O_CREAT | O_EXCL);
  ASSERT_EQ(kernel.write(file, "third"), 5);
  ASSERT_EQ(rename("new", "one", RENAME_EXCHANGE), 0);
  ASSERT_EQ(kernel.link(home, "other", home, "second name", 0), 0);
  ASSERT_EQ(kernel.unlink(home, "new", 0), 0);

  for (const DiskChange& change : kernel.changes()) {
    again.apply(change);
  }

  EXPECT_EQ(again.fingerprint(), kernel.disk().fingerprint());
  EXPECT_EQ(again.inode(*again.find("/home/one")).changed,
            kernel.disk().inode(*kernel.disk().find("/home/one")).changed);
  EXPECT_EQ(again.inode(*again.find("/home/other")).links, 2U);
}

class PoorFileSystem : public SimulatedKernelTest {
 protected:
  PoorFileSystem()
      : SimulatedKernelTest({.exchangesNames = false, .sparesNames = false, .hasFlags = false}) {}
};

TEST_F(PoorFileSystem, RefusesWhatItCannotDo) {
  EXPECT_EQ(rename("one", "other", RENAME_EXCHANGE), -EINVAL);
  EXPECT_EQ(rename("one", "new", RENAME_NOREPLACE), -EINVAL);
  int flags = 0;
  EXPECT_EQ(kernel.flags(open("one"), flags), -ENOTTY);
  EXPECT_EQ(contentsOf("one"), "first");
}

TEST_F(PoorFileSystem, StillFindsThatANameIsThere) {
  EXPECT_EQ(rename("one", "other", RENAME_NOREPLACE), -EEXIST);
  EXPECT_EQ(rename("one", "other", 0), 0);
}

}  // namespace
}  // namespace accounts
