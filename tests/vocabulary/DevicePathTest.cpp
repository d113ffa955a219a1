#include "vocabulary/DevicePath.h"

#include <gtest/gtest.h>

namespace accounts {
namespace {

TEST(DevicePath, AComponentIsAppendedBehindASeparator) {
  EXPECT_EQ(joinedPath("/var/mobile", "Library"), "/var/mobile/Library");
}

TEST(DevicePath, SeparatorsOfBothSidesBecomeOne) {
  EXPECT_EQ(joinedPath("/var/mobile/", "/Library"), "/var/mobile/Library");
}

TEST(DevicePath, TheRootGivesAnAbsolutePath) {
  EXPECT_EQ(joinedPath("/", "System/Library"), "/System/Library");
}

TEST(DevicePath, AnEmptyPathGivesAnAbsolutePath) {
  EXPECT_EQ(joinedPath("", "Library"), "/Library");
}

TEST(DevicePath, TheLastComponentStandsBehindTheLastSeparator) {
  EXPECT_EQ(splitPath("/var/mobile/com.quarx.accountsettings.plist").name,
            "com.quarx.accountsettings.plist");
}

TEST(DevicePath, ATextWithoutSeparatorIsItsOwnLastComponent) {
  EXPECT_EQ(splitPath("Accounts.plist").name, "Accounts.plist");
}

}  // namespace
}  // namespace accounts
