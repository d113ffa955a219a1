#include <gtest/gtest.h>

#include "platform/linux/LinuxFileSystem.h"
#include "platform/linux/TemporaryFile.h"
#include "tests/platform/DeviceFixture.h"

namespace accounts {
namespace {

namespace fs = std::filesystem;

class FileSystemTemporaryFileTest : public DeviceFixture {
 protected:
  FileSystemTemporaryFileTest() { makeDirectory("/home"); }

  DeviceRoot root = openImage();
  LinuxFileSystem files{root, "/home/tmp"};
};

TEST_F(FileSystemTemporaryFileTest, ATemporaryFileIsEmptyAndForItsOwnerAlone) {
  const auto path = files.makeTemporaryFile();
  ASSERT_TRUE(path);
  EXPECT_EQ(contentsOf(*path), "");
  EXPECT_EQ(permissionsOf(*path), 0600u);
}

TEST_F(FileSystemTemporaryFileTest, ItsNameTellsWhatMadeIt) {
  const auto path = files.makeTemporaryFile();
  ASSERT_TRUE(path);
  EXPECT_TRUE(path->starts_with("/home/tmp/" + std::string(kTemporaryFilePrefix))) << *path;
}

TEST_F(FileSystemTemporaryFileTest, NoTwoTemporaryFilesShareAName) {
  const auto first = files.makeTemporaryFile();
  const auto second = files.makeTemporaryFile();
  ASSERT_TRUE(first && second);
  EXPECT_NE(*first, *second);
  EXPECT_EQ(namesIn("/home/tmp").size(), 2u);
}

TEST_F(FileSystemTemporaryFileTest, AMissingTemporaryDirectoryIsMadeForItsOwnerAlone) {
  const WithMask mask(0);
  ASSERT_TRUE(files.makeTemporaryFile());
  EXPECT_EQ(permissionsOf("/home/tmp"), 0700u);
}

TEST_F(FileSystemTemporaryFileTest, AnExistingTemporaryDirectoryKeepsItsPermissions) {
  makeDirectory("/home/tmp");
  fs::permissions(onHost("/home/tmp"), fs::perms(0755));
  ASSERT_TRUE(files.makeTemporaryFile());
  EXPECT_EQ(permissionsOf("/home/tmp"), 0755u);
}

TEST_F(FileSystemTemporaryFileTest, AMissingHomeDirectoryIsNotMade) {
  fs::remove(onHost("/home"));
  EXPECT_FALSE(files.makeTemporaryFile());
  EXPECT_TRUE(namesIn("/").empty());
}

TEST_F(FileSystemTemporaryFileTest, AFileInPlaceOfTheDirectoryMeansNoTemporaryFile) {
  makeFile("/home/tmp", "contents");
  EXPECT_FALSE(files.makeTemporaryFile());
  EXPECT_EQ(contentsOf("/home/tmp"), "contents");
}

TEST_F(FileSystemTemporaryFileTest, ATemporaryDirectoryLinkedOutOfTheRootIsNotUsed) {
  makeLink("/home/tmp", outside());
  EXPECT_FALSE(files.makeTemporaryFile());
  EXPECT_TRUE(fs::is_empty(outside()));
}

}  // namespace
}  // namespace accounts
