#include <gtest/gtest.h>

#include <memory>
#include <string>

#include "tests/program/DeviceRootFixture.h"
#include "tests/program/ExitStatuses.h"
#include "tests/program/SmallDisk.h"

namespace accounts {
namespace {

/// A device whose home directory is on a disk of its own with no free block.
class FullDiskWithSafetyNet : public DeviceRootFixture {
 protected:
  void SetUp() override {
    disk_ = std::make_unique<SmallDisk>(SmallDisk::Kind::Memory, onThisMachine("/var/mobile"));
    if (disk_->reason()) {
      GTEST_SKIP() << *disk_->reason();
    }
    write(kSettingsPath, accountSettings(11, {PropertyDictionary{{"Type", "CalDAV"},
                                                                 {"Class", "MobileCalDAVAccount"},
                                                                 {"Identifier", "one"}}}));
    write(kLegacyMailPath, PropertyDictionary{{"MailAccounts", PropertyArray{}}});
    disk_->leaveBlocks(0);
  }

  void TearDown() override { disk_.reset(); }

  void makeRoom() const { disk_->makeRoom(); }

 private:
  std::unique_ptr<SmallDisk> disk_;
};

TEST_F(FullDiskWithSafetyNet, LosesNoLegacyStore) {
  const std::string settingsBefore = readText(kSettingsPath);
  const std::string legacyBefore = readText(kLegacyMailPath);

  const ProgramResult result = migrate();

  EXPECT_EQ(result.exitStatus, kMayPass) << result.errors;
  EXPECT_EQ(readText(kSettingsPath), settingsBefore);
  EXPECT_EQ(readText(kLegacyMailPath), legacyBefore);
  EXPECT_FALSE(exists(kSentinelPath));
  EXPECT_FALSE(exists("/var/mobile/Library/AccountMigration"));
}

TEST_F(FullDiskWithSafetyNet, IsMigratedOnceThereIsRoomAgain) {
  ASSERT_EQ(migrate().exitStatus, kMayPass);
  makeRoom();

  EXPECT_EQ(migrate().exitStatus, 0);

  EXPECT_EQ(readDictionary(kSettingsPath).find("Version")->integerValue(), 12);
  EXPECT_FALSE(exists(kLegacyMailPath));
}

}  // namespace
}  // namespace accounts
