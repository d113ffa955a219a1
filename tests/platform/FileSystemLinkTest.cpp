#include <gtest/gtest.h>
#include <sys/stat.h>
#include <sys/syscall.h>

#include <cerrno>
#include <cstdlib>

#include "platform/linux/LinuxFileSystem.h"
#include "tests/platform/DeviceFixture.h"

namespace accounts {
namespace {

namespace fs = std::filesystem;

class FileSystemLinkTest : public DeviceFixture {
 protected:
  FileSystemLinkTest() { makeDirectory("/kept"); }

  DeviceRoot root = openImage();
  LinuxFileSystem files{root, "/tmp"};
};

TEST_F(FileSystemLinkTest, ALinkIsTheSameFileUnderASecondName) {
  makeFile("/file", "contents");
  ASSERT_TRUE(files.linkFile("/file", "/kept/file"));
  EXPECT_EQ(statusOf("/kept/file").st_ino, statusOf("/file").st_ino);
}

TEST_F(FileSystemLinkTest, AFileThatMayNotBeReadCanBeLinked) {
  makeFile("/file", "contents");
  fs::permissions(onHost("/file"), fs::perms::none);
  ASSERT_TRUE(files.linkFile("/file", "/kept/file"));
  EXPECT_EQ(permissionsOf("/kept/file"), 0u);
}

TEST_F(FileSystemLinkTest, WhatExistsAtTheDestinationIsAFailureAndStays) {
  makeFile("/file", "contents");
  makeFile("/kept/file", "older");
  const Result result = files.linkFile("/file", "/kept/file");
  ASSERT_FALSE(result);
  EXPECT_EQ(result.error(), "Cannot link /file to /kept/file: File exists");
  EXPECT_EQ(contentsOf("/kept/file"), "older");
}

TEST_F(FileSystemLinkTest, AMissingFileIsAFailure) {
  const Result result = files.linkFile("/file", "/kept/file");
  ASSERT_FALSE(result);
  EXPECT_EQ(result.error(), "Cannot link /file: No such file or directory");
}

TEST_F(FileSystemLinkTest, OnlyRegularFilesAreLinked) {
  makeDirectory("/directory");
  makeNamedPipe("/pipe");
  makeFile("/file", "contents");
  makeLink("/link", "file");
  for (const char* source : {"/directory", "/pipe", "/link"}) {
    EXPECT_FALSE(files.linkFile(source, "/kept/file")) << source;
  }
  EXPECT_TRUE(namesIn("/kept").empty());
}

TEST_F(FileSystemLinkTest, NothingIsLinkedOutOfTheRoot) {
  makeFile("/file", "contents");
  makeLink("/linked", outside());
  EXPECT_FALSE(files.linkFile("/file", "/linked/file"));
  EXPECT_TRUE(fs::is_empty(outside()));
}

/// Where a file system makes no links: these tests end their process, in which link() fails.
class FileSystemWithoutLinksDeathTest : public FileSystemLinkTest {
 protected:
  /// Links /file to /kept/file with a link() that fails with an error number, and ends the process
  /// with 0 when that succeeds.
  [[noreturn]] void linkWhereLinkingFailsWith(int number) {
    makeSystemCallFail(SYS_linkat, number);
    std::_Exit(files.linkFile("/file", "/kept/file") ? 0 : 1);
  }
};

TEST_F(FileSystemWithoutLinksDeathTest, ACopyWithAllItsAttributesTakesTheLinksPlace) {
  makeFile("/file", "contents");
  fs::permissions(onHost("/file"), fs::perms(0640));
  fs::last_write_time(onHost("/file"), fs::file_time_type::clock::now() - std::chrono::hours(48));
  for (const int number : {EXDEV, EPERM, EMLINK, EOPNOTSUPP}) {
    EXPECT_EXIT(linkWhereLinkingFailsWith(number), testing::ExitedWithCode(0), "") << number;
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

TEST_F(FileSystemWithoutLinksDeathTest, AnyOtherErrorIsAFailureAndLeavesNothing) {
  makeFile("/file", "contents");
  for (const int number : {ENOSPC, EROFS, EIO}) {
    EXPECT_EXIT(linkWhereLinkingFailsWith(number), testing::ExitedWithCode(1), "") << number;
  }
  EXPECT_TRUE(namesIn("/kept").empty());
}

class FileSystemContentsTest : public FileSystemLinkTest {};

TEST_F(FileSystemContentsTest, EqualBytesAreTheSameContents) {
  makeFile("/one", "contents");
  makeFile("/other", "contents");
  EXPECT_TRUE(files.haveSameContents("/one", "/other"));
}

TEST_F(FileSystemContentsTest, OtherBytesAreNotTheSameContents) {
  makeFile("/one", "contents");
  for (const char* other : {"Contents", "contents and more", ""}) {
    makeFile("/other", other);
    EXPECT_FALSE(files.haveSameContents("/one", "/other")) << other;
  }
}

TEST_F(FileSystemContentsTest, OneFileHasItsOwnContentsWhetherItCanBeReadOrNot) {
  makeFile("/one", "contents");
  fs::permissions(onHost("/one"), fs::perms::none);
  fs::create_hard_link(onHost("/one"), onHost("/other"));
  const WithoutPrivileges everyone;
  EXPECT_TRUE(files.haveSameContents("/one", "/other"));
}

TEST_F(FileSystemContentsTest, TwoFilesThatCannotBeReadAreNotTheSame) {
  for (const char* path : {"/one", "/other"}) {
    makeFile(path, "contents");
    fs::permissions(onHost(path), fs::perms::none);
  }
  const WithoutPrivileges everyone;
  EXPECT_FALSE(files.haveSameContents("/one", "/other"));
}

TEST_F(FileSystemContentsTest, AMissingFileOrALinkHasNoContentsToCompare) {
  makeFile("/one", "contents");
  makeLink("/link", "one");
  EXPECT_FALSE(files.haveSameContents("/one", "/missing"));
  EXPECT_FALSE(files.haveSameContents("/link", "/one"));
}

}  // namespace
}  // namespace accounts
