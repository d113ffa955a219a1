#include <gtest/gtest.h>
#include <sys/syscall.h>

#include <cerrno>
#include <cstdio>
#include <cstdlib>

#include "platform/linux/LinuxFileSystem.h"
#include "tests/platform/DeviceFixture.h"

namespace accounts {
namespace {

namespace fs = std::filesystem;

class FileSystemRenameTest : public DeviceFixture {
 protected:
  DeviceRoot root = openImage();
  LinuxFileSystem files{root, "/tmp"};
};

TEST_F(FileSystemRenameTest, ARenamedFileKeepsItsBytesPermissionsAndIdentity) {
  makeFile("/from/file", std::string("bytes\0\xff", 7));
  fs::permissions(onHost("/from/file"), fs::perms(0640));
  makeDirectory("/to");
  const auto inode = statusOf("/from/file").st_ino;
  ASSERT_TRUE(files.renameFile("/from/file", "/to/file"));
  EXPECT_EQ(contentsOf("/to/file"), std::string("bytes\0\xff", 7));
  EXPECT_EQ(permissionsOf("/to/file"), 0640u);
  EXPECT_EQ(statusOf("/to/file").st_ino, inode);
  EXPECT_FALSE(fs::exists(onHost("/from/file")));
}

TEST_F(FileSystemRenameTest, AFileAtTheDestinationIsReplaced) {
  makeFile("/new", "new");
  makeFile("/file", "old");
  ASSERT_TRUE(files.renameFile("/new", "/file"));
  EXPECT_EQ(contentsOf("/file"), "new");
}

TEST_F(FileSystemRenameTest, ALinkAtTheDestinationIsReplacedAndItsTargetStays) {
  makeFile("/new", "new");
  makeFile("/target", "target");
  makeLink("/file", "/target");
  ASSERT_TRUE(files.renameFile("/new", "/file"));
  EXPECT_EQ(statusOf("/file").st_mode & S_IFMT, mode_t{S_IFREG});
  EXPECT_EQ(contentsOf("/target"), "target");
}

TEST_F(FileSystemRenameTest, ALinkInPlaceOfTheSourceIsNotMoved) {
  makeFile("/target", "target");
  makeLink("/new", "/target");
  makeFile("/file", "old");
  const Result result = files.renameFile("/new", "/file");
  ASSERT_FALSE(result);
  EXPECT_EQ(result.error().text, "Cannot open /new: It is a symbolic link, not a regular file");
  EXPECT_EQ(contentsOf("/file"), "old");
}

TEST_F(FileSystemRenameTest, ADirectoryAtTheDestinationIsAFailureThatKeepsTheSource) {
  makeFile("/new", "new");
  makeDirectory("/file");
  const Result result = files.renameFile("/new", "/file");
  ASSERT_FALSE(result);
  EXPECT_EQ(result.error().text, "Cannot rename /new to /file: Is a directory");
  EXPECT_EQ(contentsOf("/new"), "new");
}

TEST_F(FileSystemRenameTest, AMissingSourceIsAFailureThatKeepsTheDestination) {
  makeFile("/file", "old");
  EXPECT_FALSE(files.renameFile("/new", "/file"));
  EXPECT_EQ(contentsOf("/file"), "old");
}

TEST_F(FileSystemRenameTest, ADestinationDirectoryOutsideIsOutOfReach) {
  makeFile("/new", "new");
  makeLink("/linked", outside());
  EXPECT_FALSE(files.renameFile("/new", "/linked/file"));
  EXPECT_EQ(contentsOf("/new"), "new");
  EXPECT_TRUE(fs::is_empty(outside()));
}

TEST_F(FileSystemRenameTest, ADestinationDirectoryThatCannotBeFlushedIsAFailureBeforeTheMove) {
  makeFile("/directory/new", "new");
  // Without the right to read the directory it can be changed but not opened to flush it.
  fs::permissions(onHost("/directory"), fs::perms(0333));
  fs::permissions(onHost("/directory/new"), fs::perms(0666));
  const WithoutPrivileges restricted;
  EXPECT_FALSE(files.renameFile("/directory/new", "/directory/file"));
  EXPECT_EQ(contentsOf("/directory/new"), "new");
}

TEST_F(FileSystemRenameTest, AFileWhoseContentsDoNotReachTheMediumIsNotMoved) {
  makeFile("/new", "new");
  makeFile("/file", "old");
  EXPECT_EXIT(
      {
        makeSystemCallFail(SYS_fsync, EIO);
        const Result result = files.renameFile("/new", "/file");
        std::fprintf(stderr, "%s\n", result ? "renamed" : result.error().text.c_str());
        std::_Exit(0);
      },
      testing::ExitedWithCode(0), "Cannot flush /new: Input/output error");
  EXPECT_EQ(contentsOf("/new"), "new");
  EXPECT_EQ(contentsOf("/file"), "old");
}

}  // namespace
}  // namespace accounts
