#include "platform/linux/StagedName.h"

#include <gtest/gtest.h>

#include <limits>
#include <set>

#include "platform/linux/TemporaryFile.h"

namespace accounts {
namespace {

TEST(StagedNameTest, ANameSaysWhatItWasMadeOf) {
  constexpr std::uint64_t kLargest = std::numeric_limits<std::uint64_t>::max();
  for (const ListedPlace& each : kDevicePlaces) {
    const auto read =
        StagedName::parse(StagedName{each.place, kLargest, indexOf(each.place), 7}.text().value());
    ASSERT_TRUE(read) << each.name;
    EXPECT_EQ(read->place, each.place);
    EXPECT_EQ(read->made, kLargest);
    EXPECT_EQ(read->replaced, indexOf(each.place));
    EXPECT_EQ(read->returned, 7u);
  }
}

TEST(StagedNameTest, NoTwoNamesAreTheSame) {
  const StagedName staged;
  EXPECT_NE(staged.text(), staged.text());
}

TEST(StagedNameTest, ANameBeginsAsThatOfATemporaryFile) {
  EXPECT_TRUE(StagedName().text().value().starts_with(kTemporaryFilePrefix));
}

TEST(StagedNameTest, AMarkStandsForAFileAsItIs) {
  const FileIdentity file = {.kind = EntryKind::RegularFile,
                             .device = 1,
                             .inode = 2,
                             .size = 3,
                             .mode = 0100600,
                             .modified = {4, 5},
                             .changed = {6, 7}};
  std::set<std::uint64_t> marks = {0, markOf(file)};
  for (const auto change :
       {+[](FileIdentity& each) { ++each.inode; }, +[](FileIdentity& each) { ++each.size; },
        +[](FileIdentity& each) { ++each.mode; },
        +[](FileIdentity& each) { ++each.modified.seconds; },
        +[](FileIdentity& each) { ++each.modified.nanoseconds; }}) {
    FileIdentity other = file;
    change(other);
    marks.insert(markOf(other));
  }
  EXPECT_EQ(marks.size(), 7u);
  EXPECT_EQ(markOf(FileIdentity()), 0u);
}

TEST(StagedNameTest, AFileKeepsItsMarkUnderOtherNamesAndOnADiskWithAnotherNumber) {
  FileIdentity file;
  file.kind = EntryKind::RegularFile;
  FileIdentity renamed = file;
  renamed.device = 1;
  renamed.changed = {1, 1};
  EXPECT_EQ(markOf(renamed), markOf(file));
}

TEST(StagedNameTest, OtherNamesSayNothing) {
  for (const char* name :
       {"", ".accounts-migration-", ".accounts-migration-0123456789abcdef",
        ".accounts-migration-Settings", ".accounts-migration-Settings-1",
        ".accounts-migration-Settings-1-2-3", ".accounts-migration-Settings-1-2-0123",
        ".accounts-migration-Settings-1-x-3-0123", ".accounts-migration-Settings-1-2-x-0123",
        ".accounts-migration-Settings--2-3-0123", ".accounts-migration-Settings-1--3-0123",
        ".accounts-migration-Settings-+1-2-3-0123", ".accounts-migration-Settings- 1-2-3-0123",
        ".accounts-migration-Settings-99999999999999999999-2-3-0123",
        ".accounts-migration-settings-1-2-3-0123", ".accounts-migration-Nothing-1-2-3-0123",
        "accounts-migration-Settings-1-2-3-0123", "x.accounts-migration-Settings-1-2-3-0123"}) {
    EXPECT_FALSE(StagedName::parse(name)) << name;
  }
}

}  // namespace
}  // namespace accounts
