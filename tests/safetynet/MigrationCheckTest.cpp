#include "safetynet/MigrationCheck.h"

#include "tests/safetynet/MigrationFixture.h"

namespace accounts {
namespace {

using testing::ElementsAre;
using testing::HasSubstr;
using testing::IsEmpty;

/// What is missing after a migration that left a settings file and both stores gone.
class MigrationCheckTest : public MigrationTest {
 protected:
  std::vector<std::string> missingAfter(const PropertyDictionary& settings) {
    std::vector<DevicePlace> inputs;
    MigrationInMemory& migration = begin();
    for (const DevicePlace place :
         {DevicePlace::LegacyMail, DevicePlace::LegacyExchange, DevicePlace::Settings}) {
      if (migration.transaction().exists(place)) {
        inputs.push_back(place);
      }
    }
    save(settings);
    return whatMayBeMissing(transaction(), inputs);
  }

  const std::string settingsPath = snapshot.pathOf(DevicePlace::Settings);
};

TEST_F(MigrationCheckTest, NothingIsMissingWhereEveryAccountIsThere) {
  snapshot.addPropertyList(DevicePlace::Settings, settingsWith(11, {"one"}));
  snapshot.addPropertyList(DevicePlace::LegacyMail, mailStoreWith({"two"}));
  snapshot.addPropertyList(DevicePlace::LegacyExchange, exchangeStoreWith({"three"}));
  EXPECT_THAT(missingAfter(settingsWith(12, {"one", "two", "three"})), IsEmpty());
}

TEST_F(MigrationCheckTest, AnEmptyDeviceMissesNothing) {
  EXPECT_THAT(missingAfter(settingsWith(12)), IsEmpty());
}

TEST_F(MigrationCheckTest, WhatIsNoPropertyListIsNamed) {
  snapshot.addFile(DevicePlace::Settings, "refused");
  snapshot.addFile(DevicePlace::LegacyMail, "refused");
  EXPECT_THAT(missingAfter(settingsWith(12)),
              ElementsAre(snapshot.pathOf(DevicePlace::LegacyMail) +
                              " could not be read as a property list",
                          settingsPath + " could not be read as a property list"));
}

TEST_F(MigrationCheckTest, ASettingsFileThatLostAllItsAccountsIsNamed) {
  snapshot.addPropertyList(DevicePlace::Settings, settingsWith(11, {"one"}));
  EXPECT_THAT(missingAfter(settingsWith(12)),
              ElementsAre(settingsPath + " had accounts and has none of them now"));
}

TEST_F(MigrationCheckTest, ASettingsFileThatHasOnlyOtherAccountsNowIsNamed) {
  snapshot.addPropertyList(DevicePlace::Settings,
                           settingsWith(2, {"one", "DeviceLocalAccount", "mail"}));
  snapshot.addPropertyList(DevicePlace::LegacyMail, mailStoreWith({"mail"}));
  EXPECT_THAT(missingAfter(settingsWith(12, {"mail", "DeviceLocalAccount"})),
              ElementsAre(HasSubstr(" had accounts and has none of them now")));
}

TEST_F(MigrationCheckTest, AccountsWithoutIdentifiersAreNotMissedForTheirFreshOnes) {
  snapshot.addPropertyList(
      DevicePlace::Settings,
      PropertyDictionary{{"Version", 1}, {"Accounts", PropertyArray{PropertyDictionary()}}});
  EXPECT_THAT(missingAfter(settingsWith(12, {"fresh"})), IsEmpty());
}

TEST_F(MigrationCheckTest, ASettingsFileThatLostSomeAccountsIsNotNamed) {
  snapshot.addPropertyList(DevicePlace::Settings, settingsWith(11, {"one", "two"}));
  EXPECT_THAT(missingAfter(settingsWith(12, {"two"})), IsEmpty());
}

TEST_F(MigrationCheckTest, ALegacyStoreThatWasNotCarriedOverIsNamed) {
  snapshot.addPropertyList(DevicePlace::LegacyMail, mailStoreWith({"mail"}));
  snapshot.addPropertyList(DevicePlace::LegacyExchange, exchangeStoreWith({"exchange"}));
  EXPECT_THAT(missingAfter(settingsWith(12, {"mail"})),
              ElementsAre("Not every account of " + snapshot.pathOf(DevicePlace::LegacyExchange) +
                          " was found in the settings file"));
}

TEST_F(MigrationCheckTest, ADeliveryAccountIsAnAccountOfItsStore) {
  snapshot.addPropertyList(
      DevicePlace::LegacyMail,
      PropertyDictionary{{"DeliveryAccounts", accountsNamed("uniqueId", {"delivery"})}});
  EXPECT_THAT(missingAfter(settingsWith(12)).size(), 1u);
}

TEST_F(MigrationCheckTest, AnAccountWithoutAnIdentifierIsVouchedForByTheOthersOfItsStore) {
  snapshot.addPropertyList(
      DevicePlace::LegacyMail,
      PropertyDictionary{{"MailAccounts", PropertyArray{PropertyDictionary{{"uniqueId", "mail"}},
                                                        PropertyDictionary()}}});
  EXPECT_THAT(missingAfter(settingsWith(12, {"mail", "fresh"})), IsEmpty());
}

TEST_F(MigrationCheckTest, AStoreOfWhichNoAccountHasAnIdentifierIsNamed) {
  snapshot.addPropertyList(
      DevicePlace::LegacyMail,
      PropertyDictionary{{"MailAccounts", PropertyArray{PropertyDictionary()}}});
  EXPECT_THAT(missingAfter(settingsWith(12, {"fresh"})).size(), 1u);
}

TEST_F(MigrationCheckTest, ALegacyAccountThatBecameAChildWasCarriedOver) {
  snapshot.addPropertyList(DevicePlace::LegacyMail, mailStoreWith({"mail"}));
  const PropertyDictionary parent = {{"Identifier", "parent"},
                                     {"ChildAccounts", accountsNamed("Identifier", {"mail"})}};
  EXPECT_THAT(
      missingAfter(PropertyDictionary{{"Version", 12}, {"Accounts", PropertyArray{parent}}}),
      IsEmpty());
}

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
