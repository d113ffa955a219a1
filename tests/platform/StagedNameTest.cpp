#include "platform/linux/StagedName.h"

#include <gtest/gtest.h>

#include <limits>

#include "platform/linux/TemporaryFile.h"

namespace accounts {
namespace {

TEST(StagedNameTest, ANameSaysWhatItWasMadeOf) {
  constexpr std::uint64_t kLargest = std::numeric_limits<std::uint64_t>::max();
  for (const ListedPlace& each : kDevicePlaces) {
    const auto read =
        StagedName::parse(StagedName{each.place, kLargest, indexOf(each.place)}.text().value());
    ASSERT_TRUE(read) << each.name;
    EXPECT_EQ(read->place, each.place);
    EXPECT_EQ(read->made, kLargest);
    EXPECT_EQ(read->replaced, indexOf(each.place));
  }
}

TEST(StagedNameTest, NoTwoNamesAreTheSame) {
  const StagedName staged;
  EXPECT_NE(staged.text(), staged.text());
}

TEST(StagedNameTest, ANameBeginsAsThatOfATemporaryFile) {
  EXPECT_TRUE(StagedName().text().value().starts_with(kTemporaryFilePrefix));
}

TEST(StagedNameTest, OtherNamesSayNothing) {
  for (const char* name :
       {"", ".accounts-migration-", ".accounts-migration-0123456789abcdef",
        ".accounts-migration-Settings", ".accounts-migration-Settings-1",
        ".accounts-migration-Settings-1-2", ".accounts-migration-Settings-1-x-0123",
        ".accounts-migration-Settings--2-0123", ".accounts-migration-Settings-1--0123",
        ".accounts-migration-Settings-+1-2-0123", ".accounts-migration-Settings- 1-2-0123",
        ".accounts-migration-Settings-99999999999999999999-2-0123",
        ".accounts-migration-settings-1-2-0123", ".accounts-migration-Nothing-1-2-0123",
        "accounts-migration-Settings-1-2-0123", "x.accounts-migration-Settings-1-2-0123"}) {
    EXPECT_FALSE(StagedName::parse(name)) << name;
  }
}

}  // namespace
}  // namespace accounts
