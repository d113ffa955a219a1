#include "accountsettings/Paths.h"

#include <gtest/gtest.h>

namespace accounts {
namespace {

TEST(Paths, AComponentIsAppendedBehindASeparator) {
  EXPECT_EQ(pathByAppending("/var/mobile", "Library"), "/var/mobile/Library");
}

TEST(Paths, SeparatorsOfBothSidesBecomeOne) {
  EXPECT_EQ(pathByAppending("/var/mobile/", "/Library"), "/var/mobile/Library");
}

TEST(Paths, TheRootGivesAnAbsolutePath) {
  EXPECT_EQ(pathByAppending("/", "System/Library"), "/System/Library");
}

TEST(Paths, AnEmptyPathGivesAnAbsolutePath) {
  EXPECT_EQ(pathByAppending("", "Library"), "/Library");
}

TEST(Paths, TheLastComponentStandsBehindTheLastSeparator) {
  EXPECT_EQ(lastPathComponent("/var/mobile/com.quarx.accountsettings.plist"),
            "com.quarx.accountsettings.plist");
}

TEST(Paths, ATextWithoutSeparatorIsItsOwnLastComponent) {
  EXPECT_EQ(lastPathComponent("Accounts.plist"), "Accounts.plist");
}

}  // namespace
}  // namespace accounts
