#include <gtest/gtest.h>

#include "platform/linux/LinuxFileSystem.h"
#include "tests/platform/DeviceFixture.h"

namespace accounts {
namespace {

namespace fs = std::filesystem;

class FileSystemRemovalTest : public DeviceFixture {
 protected:
  DeviceRoot root = openImage();
  LinuxFileSystem files{root, "/tmp"};
};

TEST_F(FileSystemRemovalTest, AFileIsRemovedAndItsNeighbourStays) {
  makeFile("/directory/file", "");
  makeFile("/directory/neighbour", "");
  ASSERT_TRUE(files.removeFile("/directory/file"));
  EXPECT_EQ(namesIn("/directory"), std::vector<std::string>{"neighbour"});
}

TEST_F(FileSystemRemovalTest, ALinkIsRemovedAndItsTargetStays) {
  makeFile("/target", "contents");
  makeLink("/link", "/target");
  ASSERT_TRUE(files.removeFile("/link"));
  EXPECT_EQ(namesIn("/"), std::vector<std::string>{"target"});
}

TEST_F(FileSystemRemovalTest, ALinkToNothingIsRemoved) {
  makeLink("/link", "none");
  ASSERT_TRUE(files.removeFile("/link"));
  EXPECT_TRUE(namesIn("/").empty());
}

TEST_F(FileSystemRemovalTest, AFileOutsideIsOutOfReachOfALinkedDirectory) {
  makeHostFile(outside() / "file", "contents");
  makeLink("/link", outside());
  EXPECT_FALSE(files.removeFile("/link/file"));
  EXPECT_TRUE(fs::exists(outside() / "file"));
}

TEST_F(FileSystemRemovalTest, ADirectoryIsNotRemoved) {
  makeDirectory("/directory");
  const Result result = files.removeFile("/directory");
  ASSERT_FALSE(result);
  EXPECT_EQ(result.error().text, "Cannot remove /directory: Is a directory");
  EXPECT_TRUE(fs::is_directory(onHost("/directory")));
}

TEST_F(FileSystemRemovalTest, AMissingFileIsAFailureThatNamesIt) {
  makeDirectory("/directory");
  const Result result = files.removeFile("/directory/none");
  ASSERT_FALSE(result);
  EXPECT_EQ(result.error().text, "Cannot remove /directory/none: No such file or directory");
}

TEST_F(FileSystemRemovalTest, AFileInAReadOnlyDirectoryStays) {
  makeFile("/directory/file", "");
  fs::permissions(onHost("/directory"), fs::perms(0555));
  const WithoutPrivileges restricted;
  EXPECT_FALSE(files.removeFile("/directory/file"));
  EXPECT_TRUE(fs::exists(onHost("/directory/file")));
}

TEST_F(FileSystemRemovalTest, ANamedPipeIsRemoved) {
  makeNamedPipe("/pipe");
  ASSERT_TRUE(files.removeFile("/pipe"));
  EXPECT_TRUE(namesIn("/").empty());
}

}  // namespace
}  // namespace accounts
