#include <gtest/gtest.h>
#include <unistd.h>

#include <string>

#include "platform/linux/LinuxFileSystem.h"
#include "platform/linux/TemporaryFile.h"
#include "tests/fakes/PlainContents.h"
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

TEST_F(FileSystemTemporaryFileTest,
       ATemporaryFileIsFoundWhereItWasMadeThoughALinkTookTheDirectorysPlace) {
  const auto path = files.makeTemporaryFile();
  ASSERT_TRUE(path);
  fs::rename(onHost("/home/tmp"), onHost("/home/moved"));
  makeLink("/home/tmp", outside());

  EXPECT_TRUE(files.writeFile(*path, plainContents("contents")));
  EXPECT_TRUE(files.renameFile(*path, "/home/file"));

  EXPECT_EQ(contentsOf("/home/file"), "contents");
  EXPECT_TRUE(namesIn("/home/moved").empty());
  EXPECT_TRUE(fs::is_empty(outside()));
}

TEST_F(FileSystemTemporaryFileTest, ARenamedTemporaryFilesPathIsOneLikeAnyOther) {
  const auto path = files.makeTemporaryFile();
  ASSERT_TRUE(path && files.renameFile(*path, "/home/file"));
  fs::rename(onHost("/home/tmp"), onHost("/home/moved"));
  makeDirectory("/home/tmp");

  EXPECT_TRUE(files.writeFile(*path, plainContents("contents")));

  EXPECT_EQ(namesIn("/home/tmp").size(), 1u);
  EXPECT_TRUE(namesIn("/home/moved").empty());
}

TEST_F(FileSystemTemporaryFileTest, ALinkInTheTemporaryFilesPlaceIsNeitherWrittenThroughNorMoved) {
  makeFile("/etc/passwd", "mobile:*:" + std::to_string(::getuid()) + ":1:::\n");
  makeFile("/etc/group", "mobile:*:" + std::to_string(::getgid()) + ":\n");
  makeFile("/home/other", "contents");
  const auto path = files.makeTemporaryFile();
  ASSERT_TRUE(path && files.setOwnerAndGroup(*path, "mobile", "mobile"));
  fs::remove(onHost(*path));
  makeLink(*path, "../other");

  EXPECT_FALSE(files.writeFile(*path, plainContents("new")));
  EXPECT_FALSE(files.setOwnerAndGroup(*path, "mobile", "mobile"));
  EXPECT_FALSE(files.renameFile(*path, "/home/file"));

  EXPECT_EQ(contentsOf("/home/other"), "contents");
  EXPECT_FALSE(files.fileExists("/home/file"));
}

}  // namespace
}  // namespace accounts
