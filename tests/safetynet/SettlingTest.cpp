#include "tests/safetynet/SafetyNetFixture.h"

namespace accounts {
namespace {

using testing::ElementsAre;
using testing::HasSubstr;
using testing::IsEmpty;

using SettlingVerifiedTest = SafetyNetTest;

TEST_F(SettlingVerifiedTest, TheKeptFilesAreRemovedAndNothingIsSaid) {
  addSettings(11, {"one"});
  addLegacyMail({"two"});
  keep();
  addSettings(12, {"one", "two"});
  remove(kLegacyMailPath);

  const Settlement settlement = net.settle(PluginEnd::GaveTrue, kWrittenSave);

  EXPECT_FALSE(settlement.error);
  EXPECT_THAT(settlement.warnings, IsEmpty());
  EXPECT_THAT(settlement.keptFolders, IsEmpty());
  EXPECT_THAT(entriesOfTheHost(), IsEmpty());
  EXPECT_EQ(device.fileSystem.files.size(), 1u);
}

TEST_F(SettlingVerifiedTest, ARunWithoutASaveIsVerifiedByTheFileAlone) {
  addSettings(12);
  addLegacyMail();
  keep();
  remove(kLegacyMailPath);

  EXPECT_FALSE(net.settle(PluginEnd::GaveTrue, kNoSave).error);
  EXPECT_FALSE(isKept());
}

TEST_F(SettlingVerifiedTest, WhatIsNoPropertyListStaysKeptAndIsNamed) {
  device.fileSystem.addFile(kSettingsPath, "refused");
  keep();
  addSettings(12);

  const Settlement settlement = net.settle(PluginEnd::GaveTrue, kWrittenSave);

  EXPECT_FALSE(settlement.error);
  EXPECT_EQ(contentsOf(kept(kSettingsPath)), "refused");
  EXPECT_THAT(settlement.keptFolders, ElementsAre(folder));
  EXPECT_THAT(
      settlement.warnings,
      ElementsAre(std::string(kSettingsPath) +
                  " could not be read as a property list; the files as they were are kept in " +
                  folder +
                  ", and \"migration-host restore --root /mnt/image --from "
                  "Kept-20260102T030405Z\" puts them back"));
}

TEST_F(SettlingVerifiedTest, ASettingsFileThatLostAllItsAccountsStaysKept) {
  addSettings(11, {"one"});
  keep();
  addSettings(12);

  const Settlement settlement = net.settle(PluginEnd::GaveTrue, kWrittenSave);

  EXPECT_FALSE(settlement.error);
  EXPECT_THAT(settlement.warnings,
              ElementsAre(HasSubstr(" had accounts and has none of them now; ")));
  EXPECT_TRUE(isKept());
}

TEST_F(SettlingVerifiedTest, ASettingsFileThatHasOnlyOtherAccountsNowStaysKept) {
  addSettings(2, {"one", "DeviceLocalAccount", "mail"});
  addLegacyMail({"mail"});
  keep();
  addSettings(12, {"mail", "DeviceLocalAccount"});

  EXPECT_THAT(net.settle(PluginEnd::GaveTrue, kWrittenSave).warnings,
              ElementsAre(HasSubstr(" had accounts and has none of them now; ")));
  EXPECT_TRUE(isKept());
}

TEST_F(SettlingVerifiedTest, ASettingsFileWhoseAccountsHadNoIdentifiersIsNotKeptForTheirFreshOnes) {
  device.addPropertyList(
      kSettingsPath,
      PropertyDictionary{{"Version", 1}, {"Accounts", PropertyArray{PropertyDictionary()}}});
  keep();
  addSettings(12, {"fresh"});

  EXPECT_THAT(net.settle(PluginEnd::GaveTrue, kWrittenSave).warnings, IsEmpty());
  EXPECT_FALSE(isKept());
}

TEST_F(SettlingVerifiedTest, ASettingsFileThatLostSomeAccountsDoesNot) {
  addSettings(11, {"one", "two"});
  keep();
  addSettings(12, {"two"});

  EXPECT_THAT(net.settle(PluginEnd::GaveTrue, kWrittenSave).warnings, IsEmpty());
  EXPECT_FALSE(isKept());
}

TEST_F(SettlingVerifiedTest, ALegacyStoreThatWasNotCarriedOverStaysKept) {
  addLegacyMail({"mail"});
  addLegacyExchange({"exchange"});
  keep();
  addSettings(12, {"mail"});
  remove(kLegacyMailPath);
  remove(kLegacyExchangePath);

  const Settlement settlement = net.settle(PluginEnd::GaveTrue, kWrittenSave);

  EXPECT_FALSE(settlement.error);
  EXPECT_THAT(settlement.warnings,
              ElementsAre(HasSubstr("Not every account of " + std::string(kLegacyExchangePath) +
                                    " was found in the settings file; ")));
  EXPECT_TRUE(exists(kept(kLegacyExchangePath)));
}

TEST_F(SettlingVerifiedTest, AnAccountWithoutAnIdentifierIsVouchedForByTheOthersOfItsStore) {
  const PropertyDictionary unnamed;
  const PropertyDictionary named = {{"uniqueId", "mail"}};
  device.addPropertyList(kLegacyMailPath,
                         PropertyDictionary{{"MailAccounts", PropertyArray{named, unnamed}}});
  keep();
  addSettings(12, {"mail", "fresh"});

  EXPECT_THAT(net.settle(PluginEnd::GaveTrue, kWrittenSave).warnings, IsEmpty());
  EXPECT_FALSE(isKept());
}

TEST_F(SettlingVerifiedTest, AStoreOfWhichNoAccountHasAnIdentifierStaysKept) {
  device.addPropertyList(kLegacyMailPath,
                         PropertyDictionary{{"MailAccounts", PropertyArray{PropertyDictionary()}}});
  keep();
  addSettings(12, {"fresh"});

  EXPECT_EQ(net.settle(PluginEnd::GaveTrue, kWrittenSave).warnings.size(), 1u);
  EXPECT_TRUE(isKept());
}

TEST_F(SettlingVerifiedTest, ALegacyAccountThatBecameAChildWasCarriedOver) {
  addLegacyMail({"mail"});
  keep();
  device.addPropertyList(
      kSettingsPath,
      PropertyDictionary{
          {"Version", 12},
          {"Accounts",
           PropertyArray{PropertyDictionary{
               {"Identifier", "parent"},
               {"ChildAccounts", PropertyArray{PropertyDictionary{{"Identifier", "mail"}}}}}}}});

  EXPECT_THAT(net.settle(PluginEnd::GaveTrue, kWrittenSave).warnings, IsEmpty());
  EXPECT_FALSE(isKept());
}

TEST_F(SettlingVerifiedTest, KeptFilesThatCannotBeRemovedAreAWarning) {
  addSettings(12);
  keep();
  device.fileSystem.failWhenLineBegins("renameDirectory " + folder);

  const Settlement settlement = net.settle(PluginEnd::GaveTrue, kWrittenSave);

  EXPECT_FALSE(settlement.error);
  EXPECT_THAT(settlement.warnings, ElementsAre(HasSubstr("cannot be removed")));
  EXPECT_THAT(settlement.keptFolders, ElementsAre(folder));
}

TEST_F(SettlingVerifiedTest, TheFolderOfAnEarlierRunStaysAndIsNamed) {
  const std::string earlier = folderPath("Kept-20250101T000000Z");
  device.fileSystem.addFile(earlier + "/Accounts.plist", "of a killed run");
  addSettings(12);
  keep();

  const Settlement settlement = net.settle(PluginEnd::GaveTrue, kWrittenSave);

  EXPECT_FALSE(settlement.error);
  EXPECT_THAT(settlement.warnings,
              ElementsAre("An earlier run left files in " + earlier +
                          "; \"migration-host restore --root /mnt/image --from "
                          "Kept-20250101T000000Z\" puts them back"));
  EXPECT_THAT(settlement.keptFolders, ElementsAre(earlier));
  EXPECT_EQ(contentsOf(earlier + "/Accounts.plist"), "of a killed run");
}

class SettlingFailedTest : public SafetyNetTest, public testing::WithParamInterface<PluginEnd> {};

TEST_P(SettlingFailedTest, FilesThatAreAsTheyWereNeedNoFolder) {
  addSettings(11);
  addLegacyMail();
  keep();

  const Settlement settlement = net.settle(GetParam(), kNoSave);

  EXPECT_FALSE(settlement.error);
  EXPECT_THAT(settlement.warnings, IsEmpty());
  EXPECT_THAT(entriesOfTheHost(), IsEmpty());
  EXPECT_EQ(device.fileSystem.files.size(), 2u);
}

TEST_P(SettlingFailedTest, AChangedSettingsFileStaysAndWhatItWasIsKept) {
  addSettings(11, {"one"});
  const std::string before = contentsOf(kSettingsPath);
  keep();
  addSettings(12, {"one"});
  const std::string after = contentsOf(kSettingsPath);

  const Settlement settlement = net.settle(GetParam(), kWrittenSave);

  EXPECT_EQ(contentsOf(kSettingsPath), after);
  EXPECT_EQ(contentsOf(kept(kSettingsPath)), before);
  EXPECT_THAT(settlement.warnings,
              ElementsAre(HasSubstr("The migration stopped halfway; the files as they were are "
                                    "kept in " +
                                    folder)));
  EXPECT_THAT(settlement.keptFolders, ElementsAre(folder));
}

TEST_P(SettlingFailedTest, ALegacyStoreThatIsGoneWithoutMigratedSettingsIsPutBack) {
  addSettings(11);
  addLegacyMail({"mail"});
  const std::string before = contentsOf(kLegacyMailPath);
  keep();
  remove(kLegacyMailPath);
  device.fileSystem.addFile(kSentinelPath, "the removal had begun");

  const Settlement settlement = net.settle(GetParam(), kFailedSave);

  EXPECT_EQ(contentsOf(kLegacyMailPath), before);
  EXPECT_FALSE(exists(kSentinelPath));
  EXPECT_THAT(settlement.warnings, IsEmpty());
  EXPECT_FALSE(isKept());
}

TEST_P(SettlingFailedTest, ALegacyStoreThatIsGoneAfterAWrittenSaveStaysGone) {
  addLegacyMail({"mail"});
  keep();
  addSettings(12, {"mail"});
  remove(kLegacyMailPath);
  device.fileSystem.addFile(kSentinelPath, "the removal had begun");

  const Settlement settlement = net.settle(GetParam(), kWrittenSave);

  EXPECT_FALSE(exists(kLegacyMailPath));
  EXPECT_TRUE(exists(kSentinelPath));
  EXPECT_TRUE(exists(kept(kLegacyMailPath)));
  EXPECT_THAT(settlement.warnings, ElementsAre(HasSubstr("The migration stopped halfway; ")));
}

TEST_P(SettlingFailedTest, ALegacyStoreThatCannotBePutBackStaysKept) {
  addSettings(11);
  addLegacyMail({"mail"});
  keep();
  remove(kLegacyMailPath);
  device.fileSystem.failWhenLineBegins("rename ");

  const Settlement settlement = net.settle(GetParam(), kFailedSave);

  EXPECT_THAT(settlement.warnings, ElementsAre(HasSubstr("A legacy store cannot be put back: "),
                                               HasSubstr("The migration stopped halfway; ")));
  EXPECT_TRUE(exists(kept(kLegacyMailPath)));
}

INSTANTIATE_TEST_SUITE_P(Ends, SettlingFailedTest,
                         testing::Values(PluginEnd::GaveFalse, PluginEnd::Died),
                         [](const testing::TestParamInfo<PluginEnd>& end) {
                           return end.param == PluginEnd::Died ? "PluginDied" : "PluginGaveFalse";
                         });

TEST_F(SafetyNetTest, WhatADeadPluginSaidOfItsSavesDoesNotCount) {
  addSettings(12);
  addLegacyMail({"mail"});
  keep();
  remove(kLegacyMailPath);

  // The settings file is current, but it is the one from before: nothing was carried over to it.
  static_cast<void>(net.settle(PluginEnd::Died, kNoSave));

  EXPECT_TRUE(exists(kLegacyMailPath));
}

}  // namespace
}  // namespace accounts
