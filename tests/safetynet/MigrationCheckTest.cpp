#include "safetynet/MigrationCheck.h"

#include "tests/safetynet/MigrationFixture.h"

namespace accounts {
namespace {

class WhyNotMigratedTest : public MigrationTest {
 protected:
  WhyNotMigratedTest() { begin(); }
};

TEST_F(WhyNotMigratedTest, ASaveAtTheCurrentVersionIsAMigration) {
  save(settingsWith(12));
  EXPECT_EQ(whyNotMigrated(transaction()), std::nullopt);
}

TEST_F(WhyNotMigratedTest, ASaveThatFailedSaysWhy) {
  save(settingsWith(12));
  transaction().noteSave(LastSave::Failed);
  EXPECT_EQ(whyNotMigrated(transaction()), "the settings file was not written");
  transaction().noteSaveFailure("Cannot create it");
  EXPECT_EQ(whyNotMigrated(transaction()), "the settings file was not written: Cannot create it");
}

TEST_F(WhyNotMigratedTest, ASaveAtAnotherVersionIsNone) {
  save(settingsWith(11));
  EXPECT_EQ(whyNotMigrated(transaction()), "the settings file has not the current version");
}

TEST_F(WhyNotMigratedTest, WithoutASettingsFileThereIsNone) {
  EXPECT_EQ(whyNotMigrated(transaction()), "the settings file cannot be read as a property list");
}

TEST_F(WhyNotMigratedTest, WithoutASaveTheFileOfTheDeviceCounts) {
  snapshot.addPropertyList(DevicePlace::Settings, settingsWith(12));
  begin();
  EXPECT_EQ(whyNotMigrated(transaction()), std::nullopt);
}

}  // namespace
}  // namespace accounts
