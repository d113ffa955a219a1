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

TEST_F(WhyNotMigratedTest, ASentinelThatKeptThePluginFromMigratingIsNamed) {
  snapshot.addPropertyList(DevicePlace::Settings, settingsWith(11));
  snapshot.addFile(DevicePlace::RemovalSentinel, "removing");
  begin();
  EXPECT_EQ(whyNotMigrated(transaction()),
            "the settings file has not the current version, although " +
                snapshot.pathOf(DevicePlace::RemovalSentinel) +
                " says that the legacy stores were being removed after a migration; without that "
                "file a run migrates them");
}

PropertyDictionary settingsWithAChild() {
  PropertyDictionary parent = {{"Identifier", "parent"},
                               {"ChildAccounts", accountsNamed("Identifier", {"child"})}};
  return {{"Version", 12}, {"Accounts", PropertyArray{std::move(parent)}}};
}

TEST(AccountsBrought, AreThoseThatWereNotThereBeforeChildrenIncluded) {
  EXPECT_EQ(accountsBrought(settingsWith(11, {"parent"}), settingsWithAChild(), 10),
            std::vector<std::string>{"child"});
  EXPECT_TRUE(accountsBrought(settingsWithAChild(), settingsWith(12, {"child"}), 10).empty());
}

TEST(AccountsBrought, TheDevicesOwnAccountIsNoneOfThemAsItIsMadeAnewWhereItIsMissing) {
  EXPECT_TRUE(accountsBrought(std::nullopt, settingsWith(12, {"DeviceLocalAccount"}), 10).empty());
}

TEST(AccountsBrought, AreNoMoreThanAskedFor) {
  EXPECT_EQ(accountsBrought(std::nullopt, settingsWith(12, {"a", "b", "c"}), 2),
            (std::vector<std::string>{"a", "b"}));
}

TEST(HasAnyAccount, FindsChildrenToo) {
  EXPECT_TRUE(hasAnyAccount(settingsWithAChild(), {"other", "child"}));
  EXPECT_FALSE(hasAnyAccount(settingsWithAChild(), {"other"}));
  EXPECT_FALSE(hasAnyAccount(std::nullopt, {"child"}));
}

}  // namespace
}  // namespace accounts
