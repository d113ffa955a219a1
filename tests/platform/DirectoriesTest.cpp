#include <gtest/gtest.h>

#include "platform/linux/LinuxHomeDirectory.h"
#include "platform/linux/LinuxMailDirectory.h"
#include "vocabulary/DevicePath.h"

namespace accounts {
namespace {

TEST(DevicePathTest, PathsAreJoinedByOneSeparator) {
  EXPECT_EQ(joinedPath("/one", "two"), "/one/two");
  EXPECT_EQ(joinedPath("/one//", "two"), "/one/two");
  EXPECT_EQ(joinedPath("/", "two"), "/two");
}

TEST(DevicePathTest, APathIsSplitAtItsLastSeparator) {
  EXPECT_EQ(splitPath("/one/two/").directory, "/one");
  EXPECT_EQ(splitPath("/one/two/").name, "two");
  EXPECT_EQ(splitPath("/one").directory, "/");
  EXPECT_EQ(splitPath("one").directory, "/");
  EXPECT_EQ(splitPath("/one//two").directory, "/one");
}

TEST(DevicePathTest, TheRootHasNoName) {
  EXPECT_EQ(splitPath("/").name, "");
  EXPECT_EQ(splitPath("//").name, "");
  EXPECT_EQ(splitPath("").name, "");
}

TEST(HomeDirectoryTest, ThePathHasNoSeparatorAtItsEnd) {
  EXPECT_EQ(LinuxHomeDirectory("/var/mobile/").path(), "/var/mobile");
  EXPECT_EQ(LinuxHomeDirectory("/var/mobile").path(), "/var/mobile");
}

TEST(MailDirectoryTest, MailLiesInTheHomeDirectory) {
  LinuxHomeDirectory home("/var/mobile");
  EXPECT_EQ(LinuxMailDirectory(home).path(), "/var/mobile/Library/Mail");
}

}  // namespace
}  // namespace accounts
