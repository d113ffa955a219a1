#include <gtest/gtest.h>

#include <optional>

#include "platform/linux/LinuxFileSystem.h"
#include "tests/platform/DeviceFixture.h"

namespace accounts {
namespace {

namespace fs = std::filesystem;

using Names = std::vector<std::string>;

class FileSystemEntriesTest : public DeviceFixture {
 protected:
  DeviceRoot root = openImage();
  LinuxFileSystem files{root, "/tmp"};
};

TEST_F(FileSystemEntriesTest, EachKindOfEntryIsTold) {
  makeFile("/file", "contents");
  makeDirectory("/directory");
  makeNamedPipe("/pipe");
  EXPECT_EQ(files.kindOfEntry("/file"), EntryKind::RegularFile);
  EXPECT_EQ(files.kindOfEntry("/directory"), EntryKind::Directory);
  EXPECT_EQ(files.kindOfEntry("/pipe"), EntryKind::Other);
  EXPECT_EQ(files.kindOfEntry("/missing"), EntryKind::Nothing);
  EXPECT_EQ(files.kindOfEntry("/missing/file"), EntryKind::Nothing);
}

TEST_F(FileSystemEntriesTest, ALinkIsNotFollowed) {
  makeFile("/file", "contents");
  makeLink("/link", "file");
  makeLink("/dangling", "missing");
  EXPECT_EQ(files.kindOfEntry("/link"), EntryKind::Other);
  EXPECT_EQ(files.kindOfEntry("/dangling"), EntryKind::Other);
}

TEST_F(FileSystemEntriesTest, WhatMayNotBeLookedAtIsUnknownRatherThanMissing) {
  makeFile("/closed/file", "contents");
  fs::permissions(onHost("/closed"), fs::perms::none);
  const WithoutPrivileges everyone;
  EXPECT_EQ(files.kindOfEntry("/closed/file").error().number, EACCES);
}

TEST_F(FileSystemEntriesTest, TheNamesInADirectoryAreSorted) {
  for (const char* name : {"/directory/b", "/directory/B", "/directory/a"}) {
    makeFile(name, "");
  }
  makeDirectory("/directory/c");
  EXPECT_EQ(files.directoryEntries("/directory"), (Names{"B", "a", "b", "c"}));
}

TEST_F(FileSystemEntriesTest, OnlyADirectoryHasNamesInIt) {
  makeFile("/file", "contents");
  EXPECT_EQ(files.directoryEntries("/file").error().number, ENOTDIR);
  EXPECT_EQ(files.directoryEntries("/missing").error().number, ENOENT);
}

TEST_F(FileSystemEntriesTest, AnEmptyDirectoryIsRemoved) {
  makeDirectory("/directory");
  ASSERT_TRUE(files.removeDirectory("/directory"));
  EXPECT_TRUE(namesIn("/").empty());
}

TEST_F(FileSystemEntriesTest, ADirectoryWithSomethingInItIsNotRemoved) {
  makeFile("/directory/file", "contents");
  const Result result = files.removeDirectory("/directory");
  ASSERT_FALSE(result);
  EXPECT_EQ(result.error().text, "Cannot remove the directory /directory: Directory not empty");
  EXPECT_EQ(contentsOf("/directory/file"), "contents");
}

TEST_F(FileSystemEntriesTest, AFileIsNoDirectoryToRemove) {
  makeFile("/file", "contents");
  EXPECT_FALSE(files.removeDirectory("/file"));
  EXPECT_EQ(contentsOf("/file"), "contents");
}

TEST_F(FileSystemEntriesTest, ADirectoryIsRenamedWithWhatIsInIt) {
  makeFile("/directory/file", "contents");
  ASSERT_TRUE(files.renameDirectory("/directory", "/renamed"));
  EXPECT_EQ(namesIn("/"), Names{"renamed"});
  EXPECT_EQ(contentsOf("/renamed/file"), "contents");
}

TEST_F(FileSystemEntriesTest, ADirectoryIsNotRenamedOverOneWithSomethingInIt) {
  makeFile("/directory/file", "contents");
  makeFile("/other/file", "other contents");
  EXPECT_FALSE(files.renameDirectory("/directory", "/other"));
  EXPECT_EQ(contentsOf("/directory/file"), "contents");
  EXPECT_EQ(contentsOf("/other/file"), "other contents");
}

TEST_F(FileSystemEntriesTest, AFileIsNoDirectoryToRename) {
  makeFile("/file", "contents");
  EXPECT_FALSE(files.renameDirectory("/file", "/renamed"));
  EXPECT_EQ(namesIn("/"), Names{"file"});
}

TEST_F(FileSystemEntriesTest, OnlyADirectoryCanBeSynchronized) {
  makeFile("/directory/file", "contents");
  EXPECT_TRUE(files.synchronizeDirectory("/directory"));
  EXPECT_FALSE(files.synchronizeDirectory("/directory/file"));
  EXPECT_FALSE(files.synchronizeDirectory("/missing"));
}

}  // namespace
}  // namespace accounts
