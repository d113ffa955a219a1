#include "platform/linux/LinkedOrCopied.h"

#include <gtest/gtest.h>
#include <sys/stat.h>
#include <sys/syscall.h>

#include <cerrno>
#include <cstdlib>

#include "tests/platform/DeviceFixture.h"

namespace accounts {
namespace {

namespace fs = std::filesystem;

class LinkedOrCopiedTest : public DeviceFixture {
 protected:
  LinkedOrCopiedTest() { makeDirectory("/kept"); }

  /// Why /kept/file was not made of what is at a path; nothing when it was.
  std::string keep(const char* source = "/file") {
    const auto from = root.locate(source);
    const auto to = from ? root.locate("/kept/file") : from.error();
    return failureOf(to ? linkOrCopy(*from, *to) : to.error()).text;
  }

  DeviceRoot root = openImage();
};

TEST_F(LinkedOrCopiedTest, ALinkIsTheSameFileUnderASecondName) {
  makeFile("/file", "contents");
  EXPECT_EQ(keep(), "");
  EXPECT_EQ(statusOf("/kept/file").st_ino, statusOf("/file").st_ino);
}

TEST_F(LinkedOrCopiedTest, AFileThatMayNotBeReadIsLinked) {
  makeFile("/file", "contents");
  fs::permissions(onHost("/file"), fs::perms::none);
  EXPECT_EQ(keep(), "");
  EXPECT_EQ(permissionsOf("/kept/file"), 0u);
}

TEST_F(LinkedOrCopiedTest, WhatExistsAtTheDestinationIsAFailureAndStays) {
  makeFile("/file", "contents");
  makeFile("/kept/file", "older");
  EXPECT_EQ(keep(), "Cannot create /kept/file: File exists");
  EXPECT_EQ(contentsOf("/kept/file"), "older");
}

TEST_F(LinkedOrCopiedTest, AMissingFileIsAFailure) {
  EXPECT_EQ(keep(), "Cannot open /file: No such file or directory");
  EXPECT_TRUE(namesIn("/kept").empty());
}

TEST_F(LinkedOrCopiedTest, ADirectoryIsAFailure) {
  makeDirectory("/file");
  EXPECT_EQ(keep(), "Cannot open /file: It is a directory, not a regular file");
  EXPECT_TRUE(namesIn("/kept").empty());
}

TEST_F(LinkedOrCopiedTest, ASymbolicLinkAndANamedPipeAreLinkedThemselves) {
  makeLink("/link", "nowhere");
  EXPECT_EQ(keep("/link"), "");
  EXPECT_EQ(fs::read_symlink(onHost("/kept/file")), "nowhere");
  fs::remove(onHost("/kept/file"));

  makeNamedPipe("/pipe");
  EXPECT_EQ(keep("/pipe"), "");
  EXPECT_EQ(statusOf("/kept/file").st_ino, statusOf("/pipe").st_ino);
}

/// Where a file system makes no links: these tests end their process, in which link() fails.
class FileSystemWithoutLinksDeathTest : public LinkedOrCopiedTest {
 protected:
  [[noreturn]] void keepWhereACallFails(long systemCall, int number, mode_t mask = 022) {
    makeSystemCallFail(SYS_linkat, EPERM);
    makeSystemCallFail(systemCall, number);
    const WithMask masked(mask);
    const std::string error = keep();
    std::fputs(error.c_str(), stderr);
    std::_Exit(error.empty() ? 0 : 1);
  }
};

TEST_F(FileSystemWithoutLinksDeathTest, ACopyWithAllItsAttributesTakesTheLinksPlace) {
  makeFile("/file", "contents");
  fs::permissions(onHost("/file"), fs::perms(0640));
  fs::last_write_time(onHost("/file"), fs::file_time_type::clock::now() - std::chrono::hours(48));
  for (const int number : {EXDEV, EPERM, EMLINK, EOPNOTSUPP, EIO}) {
    EXPECT_EXIT(keepWhereACallFails(SYS_linkat, number, 0777), testing::ExitedWithCode(0), "")
        << number;
    EXPECT_EQ(contentsOf("/kept/file"), "contents");
    const struct stat copy = statusOf("/kept/file");
    const struct stat original = statusOf("/file");
    EXPECT_NE(copy.st_ino, original.st_ino);
    EXPECT_EQ(copy.st_mode, original.st_mode);
    EXPECT_EQ(copy.st_uid, original.st_uid);
    EXPECT_EQ(copy.st_gid, original.st_gid);
    EXPECT_EQ(copy.st_mtim.tv_sec, original.st_mtim.tv_sec);
    EXPECT_EQ(copy.st_mtim.tv_nsec, original.st_mtim.tv_nsec);
    fs::remove(onHost("/kept/file"));
  }
}

TEST_F(FileSystemWithoutLinksDeathTest, ACopyIsTheUsersOwnWhereThatUserMayGiveNoFileAway) {
  makeFile("/file", "contents");
  EXPECT_EXIT(keepWhereACallFails(SYS_fchown, EPERM), testing::ExitedWithCode(0), "");
  EXPECT_EQ(contentsOf("/kept/file"), "contents");
}

TEST_F(FileSystemWithoutLinksDeathTest, ACopyThatCannotBeMadeLeavesNothing) {
  makeFile("/file", "contents");
  for (const long call : {SYS_write, SYS_fchmod, SYS_utimensat, SYS_fsync}) {
    // What cannot be written cannot be told either.
    EXPECT_EXIT(keepWhereACallFails(call, EIO), testing::ExitedWithCode(1), "") << call;
    EXPECT_TRUE(namesIn("/kept").empty()) << call;
  }
  EXPECT_EXIT(keepWhereACallFails(SYS_fchown, EIO), testing::ExitedWithCode(1),
              "Cannot copy to /kept/file: Input/output error");
  EXPECT_TRUE(namesIn("/kept").empty());
}

TEST_F(FileSystemWithoutLinksDeathTest, ACopyIsItsOwnersAloneUntilItIsWhole) {
  makeFile("/file", "contents");
  fs::permissions(onHost("/file"), fs::perms(0644));
  const auto keepHalf = [&] {
    // So that what was made stays as it was made.
    makeSystemCallFail(SYS_unlinkat, EIO);
    keepWhereACallFails(SYS_fchmod, EIO, 0);
  };
  EXPECT_EXIT(keepHalf(), testing::ExitedWithCode(1), "");
  EXPECT_EQ(permissionsOf("/kept/file"), 0600u);
}

TEST_F(FileSystemWithoutLinksDeathTest, ALinkWhoseContentsCannotBeFlushedIsNone) {
  makeFile("/file", "contents");
  const auto keepUnflushed = [&] {
    makeSystemCallFail(SYS_fsync, EIO);
    const std::string error = keep();
    std::fputs(error.c_str(), stderr);
    std::_Exit(error.empty() ? 0 : 1);
  };
  EXPECT_EXIT(keepUnflushed(), testing::ExitedWithCode(1),
              "Cannot flush /file: Input/output error");
  EXPECT_TRUE(namesIn("/kept").empty());
}

TEST_F(FileSystemWithoutLinksDeathTest, OnlyARegularFileIsCopied) {
  makeLink("/file", "nowhere");
  EXPECT_EXIT(keepWhereACallFails(SYS_linkat, EPERM), testing::ExitedWithCode(1),
              "It is a symbolic link, not a regular file");
  EXPECT_TRUE(namesIn("/kept").empty());
}

}  // namespace
}  // namespace accounts
