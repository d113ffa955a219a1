#include <gtest/gtest.h>
#include <sys/syscall.h>

#include <cerrno>
#include <cstdlib>

#include "platform/linux/FileContents.h"
#include "platform/linux/LinuxFileSystem.h"
#include "tests/platform/DeviceFixture.h"

namespace accounts {
namespace {

namespace fs = std::filesystem;

class FileSystemCopyTest : public DeviceFixture {
 protected:
  DeviceRoot root = openImage();
  LinuxFileSystem files{root, "/tmp"};
};

TEST_F(FileSystemCopyTest, ACopyHasTheBytesAndPermissionsOfItsSource) {
  std::string contents(200'000, 'a');
  contents += std::string("\0\xff", 2);
  makeFile("/source", contents);
  fs::permissions(onHost("/source"), fs::perms(0640));
  ASSERT_TRUE(files.copyFile("/source", "/copy"));
  EXPECT_EQ(contentsOf("/copy"), contents);
  EXPECT_EQ(permissionsOf("/copy"), 0640u);
  EXPECT_EQ(contentsOf("/source"), contents);
}

using FileSystemCopyDeathTest = FileSystemCopyTest;

TEST_F(FileSystemCopyDeathTest, ACopyIsItsOwnersAloneUntilItIsWhole) {
  makeFile("/source", "contents");
  fs::permissions(onHost("/source"), fs::perms(0644));
  const auto copyHalf = [&] {
    makeSystemCallFail(SYS_fchmod, EIO);
    // So that what was made stays as it was made.
    makeSystemCallFail(SYS_unlinkat, EIO);
    const WithMask masked(0);
    std::_Exit(files.copyFile("/source", "/copy") ? 0 : 1);
  };
  EXPECT_EXIT(copyHalf(), testing::ExitedWithCode(1), "");
  EXPECT_EQ(permissionsOf("/copy"), 0600u);
}

TEST_F(FileSystemCopyTest, AnExistingFileIsNotCopiedOver) {
  makeFile("/source", "new");
  makeFile("/copy", "old");
  const Result result = files.copyFile("/source", "/copy");
  ASSERT_FALSE(result);
  EXPECT_EQ(result.error().text, "Cannot create /copy: File exists");
  EXPECT_EQ(contentsOf("/copy"), "old");
}

TEST_F(FileSystemCopyTest, ALinkAtTheDestinationIsNotFollowed) {
  makeFile("/source", "new");
  makeFile("/target", "old");
  makeLink("/linked", "/target");
  makeLink("/dangling", "/none");
  EXPECT_FALSE(files.copyFile("/source", "/linked"));
  EXPECT_FALSE(files.copyFile("/source", "/dangling"));
  EXPECT_EQ(contentsOf("/target"), "old");
  EXPECT_FALSE(fs::exists(onHost("/none")));
}

TEST_F(FileSystemCopyTest, ALinkAtTheSourceIsCopiedAsTheFileItLeadsTo) {
  makeFile("/target", "contents");
  makeLink("/source", "/target");
  ASSERT_TRUE(files.copyFile("/source", "/copy"));
  EXPECT_EQ(statusOf("/copy").st_mode & S_IFMT, mode_t{S_IFREG});
  EXPECT_EQ(contentsOf("/copy"), "contents");
}

TEST_F(FileSystemCopyTest, AMissingSourceFailsAndLeavesNothing) {
  const Result result = files.copyFile("/none", "/copy");
  ASSERT_FALSE(result);
  EXPECT_EQ(result.error().text, "Cannot open /none: No such file or directory");
  EXPECT_TRUE(namesIn("/").empty());
}

TEST_F(FileSystemCopyTest, AMissingDestinationDirectoryFails) {
  makeFile("/source", "contents");
  EXPECT_FALSE(files.copyFile("/source", "/none/copy"));
}

TEST_F(FileSystemCopyTest, ANamedPipeIsNotCopied) {
  makeNamedPipe("/pipe");
  EXPECT_FALSE(files.copyFile("/pipe", "/copy"));
  EXPECT_FALSE(fs::exists(onHost("/copy")));
}

TEST_F(FileSystemCopyTest, AFileAboveTheLargestSizeIsNotCopied) {
  makeFile("/source", "");
  fs::resize_file(onHost("/source"), kLargestFileSize + 1);
  EXPECT_FALSE(files.copyFile("/source", "/copy"));
  EXPECT_FALSE(fs::exists(onHost("/copy")));
}

TEST_F(FileSystemCopyTest, ACopyThatTheDiskHasNoRoomForIsRemoved) {
  makeFile("/source", "contents");
  const WithLargestWrittenFile full(4);
  const Result result = files.copyFile("/source", "/copy");
  ASSERT_FALSE(result);
  EXPECT_EQ(result.error().text, "Cannot write /copy: File too large");
  EXPECT_FALSE(fs::exists(onHost("/copy")));
}

}  // namespace
}  // namespace accounts
