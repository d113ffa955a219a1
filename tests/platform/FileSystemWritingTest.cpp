#include <gtest/gtest.h>
#include <sys/syscall.h>

#include <cerrno>
#include <cstdio>
#include <cstdlib>

#include "platform/linux/LinuxFileSystem.h"
#include "platform/linux/TemporaryFile.h"
#include "tests/fakes/PlainContents.h"
#include "tests/platform/DeviceFixture.h"

namespace accounts {
namespace {

namespace fs = std::filesystem;

class FileSystemWritingTest : public DeviceFixture {
 protected:
  DeviceRoot root = openImage();
  LinuxFileSystem files{root, "/tmp"};
};

TEST_F(FileSystemWritingTest, ANewFileHoldsTheContentsForItsOwnerAlone) {
  ASSERT_TRUE(files.createFile("/file", "contents"));
  EXPECT_EQ(contentsOf("/file"), "contents");
  EXPECT_EQ(permissionsOf("/file"), 0600u);
}

TEST_F(FileSystemWritingTest, CreatingReplacesAFileThatExists) {
  makeFile("/file", "old and longer");
  ASSERT_TRUE(files.createFile("/file", "new"));
  EXPECT_EQ(contentsOf("/file"), "new");
}

TEST_F(FileSystemWritingTest, CreatingReplacesALinkAndLeavesItsTarget) {
  makeFile("/target", "target");
  makeLink("/file", "/target");
  ASSERT_TRUE(files.createFile("/file", "new"));
  EXPECT_EQ(contentsOf("/target"), "target");
  EXPECT_EQ(contentsOf("/file"), "new");
}

TEST_F(FileSystemWritingTest, CreatingInAMissingDirectoryFails) {
  const Result result = files.createFile("/none/file", "contents");
  ASSERT_FALSE(result);
  EXPECT_EQ(result.error().text, "Cannot open /none: No such file or directory");
}

TEST_F(FileSystemWritingTest, WritingInPlaceKeepsTheFileAndReplacesItsContents) {
  makeFile("/file", "old and longer");
  const auto before = statusOf("/file").st_ino;
  ASSERT_TRUE(files.writeFile("/file", plainContents("new")));
  EXPECT_EQ(contentsOf("/file"), "new");
  EXPECT_EQ(statusOf("/file").st_ino, before);
}

TEST_F(FileSystemWritingTest, ContentsInPiecesAreWrittenOneBehindTheOther) {
  const SerializedPropertyList contents(
      "value", [](const PropertyValue&, const SerializedPropertyList::Taker& take) {
        return take("first") && take("") && take("later");
      });
  ASSERT_TRUE(files.writeFile("/in-place", contents));
  EXPECT_EQ(contentsOf("/in-place"), "firstlater");
  ASSERT_TRUE(files.writeFileAtomically("/atomically", contents));
  EXPECT_EQ(contentsOf("/atomically"), "firstlater");
}

TEST_F(FileSystemWritingTest, NoPieceIsAskedForAfterOneThatCannotBeWritten) {
  makeFile("/file", "old");
  static bool isAskedForMore = false;
  const SerializedPropertyList contents(
      "value", [](const PropertyValue&, const SerializedPropertyList::Taker& take) {
        return take("longer than that") && (isAskedForMore = true) && take("more");
      });
  const WithLargestWrittenFile full(4);
  EXPECT_FALSE(files.writeFile("/file", contents));
  EXPECT_FALSE(isAskedForMore);
}

TEST_F(FileSystemWritingTest, ContentsThatCannotAllBeMadeAreAFailure) {
  makeFile("/file", "old");
  const SerializedPropertyList contents(
      "value", [](const PropertyValue&, const SerializedPropertyList::Taker& take) {
        return take("a part") && false;
      });
  EXPECT_FALSE(files.writeFile("/in-place", contents));
  EXPECT_FALSE(files.writeFileAtomically("/file", contents));
  EXPECT_EQ(contentsOf("/file"), "old");
}

TEST_F(FileSystemWritingTest, WritingInPlaceMakesAMissingFile) {
  ASSERT_TRUE(files.writeFile("/file", plainContents("new")));
  EXPECT_EQ(contentsOf("/file"), "new");
  EXPECT_EQ(permissionsOf("/file"), 0600u);
}

TEST_F(FileSystemWritingTest, WritingInPlaceDoesNotFollowALink) {
  makeFile("/target", "target");
  makeLink("/file", "/target");
  const Result result = files.writeFile("/file", plainContents("new"));
  ASSERT_FALSE(result);
  EXPECT_EQ(result.error().text, "Cannot open /file: It is a symbolic link, not a regular file");
  EXPECT_EQ(contentsOf("/target"), "target");
}

TEST_F(FileSystemWritingTest, WritingInPlaceToANamedPipeFailsAtOnce) {
  makeNamedPipe("/pipe");
  EXPECT_FALSE(files.writeFile("/pipe", plainContents("new")));
}

TEST_F(FileSystemWritingTest, WritingInPlaceToADirectoryFails) {
  makeDirectory("/directory");
  EXPECT_FALSE(files.writeFile("/directory", plainContents("new")));
}

TEST_F(FileSystemWritingTest, WritingInPlaceFailsOnAFullDisk) {
  makeFile("/file", "old");
  const WithLargestWrittenFile full(4);
  const Result result = files.writeFile("/file", plainContents("longer than that"));
  ASSERT_FALSE(result);
  EXPECT_EQ(result.error().text, "Cannot write /file: File too large");
}

TEST_F(FileSystemWritingTest, WritingAtomicallyReplacesTheFileWithANewOne) {
  makeFile("/directory/file", "old");
  const auto before = statusOf("/directory/file").st_ino;
  ASSERT_TRUE(files.writeFileAtomically("/directory/file", plainContents("new")));
  EXPECT_EQ(contentsOf("/directory/file"), "new");
  EXPECT_NE(statusOf("/directory/file").st_ino, before);
  EXPECT_EQ(namesIn("/directory"), std::vector<std::string>{"file"});
}

TEST_F(FileSystemWritingTest, WritingAtomicallyOnAFullDiskLeavesTheOldFileAlone) {
  makeFile("/directory/file", "old");
  const WithLargestWrittenFile full(4);
  EXPECT_FALSE(files.writeFileAtomically("/directory/file", plainContents("longer than that")));
  EXPECT_EQ(contentsOf("/directory/file"), "old");
  EXPECT_EQ(namesIn("/directory"), std::vector<std::string>{"file"});
}

TEST_F(FileSystemWritingTest, WritingAtomicallyFailsWhenTheContentsDoNotReachTheMedium) {
  makeFile("/directory/file", "old");
  EXPECT_EXIT(
      {
        makeSystemCallFail(SYS_fsync, EIO);
        const Result result = files.writeFileAtomically("/directory/file", plainContents("new"));
        std::fprintf(stderr, "%s\n", result ? "written" : result.error().text.c_str());
        std::_Exit(0);
      },
      testing::ExitedWithCode(0), "Cannot write /directory/file: Input/output error");
  EXPECT_EQ(contentsOf("/directory/file"), "old");
  EXPECT_EQ(namesIn("/directory"), std::vector<std::string>{"file"});
}

TEST_F(FileSystemWritingTest, WritingAtomicallyOverADirectoryFailsAndLeavesNothingBehind) {
  makeDirectory("/directory/file");
  const Result result = files.writeFileAtomically("/directory/file", plainContents("new"));
  ASSERT_FALSE(result);
  EXPECT_NE(result.error().text.find("Is a directory"), std::string::npos);
  EXPECT_EQ(namesIn("/directory"), std::vector<std::string>{"file"});
}

}  // namespace
}  // namespace accounts
