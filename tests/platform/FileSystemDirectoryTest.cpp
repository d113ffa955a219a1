#include <gtest/gtest.h>

#include "platform/linux/LinuxFileSystem.h"
#include "tests/platform/DeviceFixture.h"

namespace accounts {
namespace {

namespace fs = std::filesystem;

constexpr unsigned kEveryoneMayWrite = 0777;

class FileSystemDirectoryTest : public DeviceFixture {
 protected:
  DeviceRoot root = openImage();
  LinuxFileSystem files{root, "/tmp"};
};

TEST_F(FileSystemDirectoryTest, ADirectoryGetsExactlyThePermissionsWhateverTheMask) {
  const WithMask mask(077);
  ASSERT_TRUE(files.createDirectoryWithIntermediates("/directory", kEveryoneMayWrite));
  EXPECT_EQ(permissionsOf("/directory"), 0777u);
}

TEST_F(FileSystemDirectoryTest, MissingParentsAreMadeWithTheDefaultPermissions) {
  const WithMask mask(022);
  ASSERT_TRUE(files.createDirectoryWithIntermediates("/Library/Logs/Crash", kEveryoneMayWrite));
  EXPECT_EQ(permissionsOf("/Library"), 0755u);
  EXPECT_EQ(permissionsOf("/Library/Logs"), 0755u);
  EXPECT_EQ(permissionsOf("/Library/Logs/Crash"), 0777u);
}

TEST_F(FileSystemDirectoryTest, ExistingParentsKeepTheirPermissions) {
  makeDirectory("/Library");
  fs::permissions(onHost("/Library"), fs::perms(0700));
  ASSERT_TRUE(files.createDirectoryWithIntermediates("/Library/Logs", kEveryoneMayWrite));
  EXPECT_EQ(permissionsOf("/Library"), 0700u);
}

TEST_F(FileSystemDirectoryTest, SeparatorsAtTheEndAndInARowDoNotMatter) {
  ASSERT_TRUE(files.createDirectoryWithIntermediates("/one//two/", kEveryoneMayWrite));
  EXPECT_EQ(namesIn("/one"), std::vector<std::string>{"two"});
}

TEST_F(FileSystemDirectoryTest, ALinkedParentIsFollowedWithinTheRoot) {
  makeDirectory("/private");
  makeLink("/linked", "/private");
  ASSERT_TRUE(files.createDirectoryWithIntermediates("/linked/directory", kEveryoneMayWrite));
  EXPECT_EQ(permissionsOf("/private/directory"), 0777u);
}

TEST_F(FileSystemDirectoryTest, NothingIsMadeOutsideThroughALinkedParent) {
  makeLink("/linked", outside());
  EXPECT_FALSE(files.createDirectoryWithIntermediates("/linked/directory", kEveryoneMayWrite));
  EXPECT_TRUE(fs::is_empty(outside()));
}

TEST_F(FileSystemDirectoryTest, AnExistingDirectoryIsAFailureAndKeepsItsPermissions) {
  makeDirectory("/directory");
  fs::permissions(onHost("/directory"), fs::perms(0700));
  const Result result = files.createDirectoryWithIntermediates("/directory", kEveryoneMayWrite);
  ASSERT_FALSE(result);
  EXPECT_EQ(result.error().text, "Cannot create the directory /directory: File exists");
  EXPECT_EQ(permissionsOf("/directory"), 0700u);
}

TEST_F(FileSystemDirectoryTest, AFileInPlaceOfAParentIsAFailure) {
  makeFile("/Library", "contents");
  const Result result = files.createDirectoryWithIntermediates("/Library/Logs", kEveryoneMayWrite);
  ASSERT_FALSE(result);
  EXPECT_EQ(result.error().text, "Cannot create the directory /Library: File exists");
  EXPECT_EQ(contentsOf("/Library"), "contents");
}

}  // namespace
}  // namespace accounts
