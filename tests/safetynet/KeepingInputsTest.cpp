#include "tests/safetynet/SafetyNetFixture.h"

namespace accounts {
namespace {

using testing::ElementsAre;
using testing::HasSubstr;
using testing::IsEmpty;

using KeepingInputsTest = SafetyNetTest;

TEST_F(KeepingInputsTest, TheSettingsFileAndBothLegacyStoresAreKept) {
  addSettings(11);
  addLegacyMail();
  addLegacyExchange();

  keep();

  for (const std::string_view path : {kSettingsPath, kLegacyMailPath, kLegacyExchangePath}) {
    EXPECT_EQ(contentsOf(kept(path)), contentsOf(path)) << path;
  }
  EXPECT_EQ(device.fileSystem.directories.at(folder), 0700u);
}

TEST_F(KeepingInputsTest, OnlyWhatIsThereIsKept) {
  addLegacyMail();

  keep();

  EXPECT_TRUE(exists(kept(kLegacyMailPath)));
  EXPECT_FALSE(exists(kept(kSettingsPath)));
}

TEST_F(KeepingInputsTest, NothingToKeepMeansNoFolder) {
  keep();

  EXPECT_FALSE(device.fileSystem.directories.contains("/var/mobile/Library/AccountMigration"));
}

TEST_F(KeepingInputsTest, EverythingIsOnTheMediumBeforeTheFolderHasItsName) {
  addSettings(11);

  keep();

  const std::string unfinished = folderPath("Unfinished-20260102T030405Z");
  const auto& journal = device.journal;
  const auto position = [&](const std::string& line) {
    return std::ranges::find(journal, line) - journal.begin();
  };
  const auto linked = position("link " + std::string(kSettingsPath) + " -> " + unfinished +
                               "/com.quarx.accountsettings.plist");
  const auto flushed = position("synchronizeDirectory " + unfinished);
  const auto named = position("renameDirectory " + unfinished + " -> " + folder);
  EXPECT_LT(position("synchronizeDirectory /var/mobile/Library"), linked);
  EXPECT_LT(linked, flushed);
  EXPECT_LT(flushed, named);
  EXPECT_LT(named, std::ssize(journal));
}

TEST_F(KeepingInputsTest, AFolderThatExistsIsNeverTouched) {
  addSettings(11);
  device.fileSystem.addFile(kept(kSettingsPath), "of a killed run");

  keep();

  EXPECT_EQ(contentsOf(kept(kSettingsPath)), "of a killed run");
  EXPECT_EQ(contentsOf(folder + "-2/com.quarx.accountsettings.plist"), contentsOf(kSettingsPath));
}

TEST_F(KeepingInputsTest, WhatAKilledRunLeftUnfinishedIsRemoved) {
  device.fileSystem.addFile(folderPath("Unfinished-20250101T000000Z/Accounts.plist"), "half");
  device.fileSystem.addFile("/var/mobile/Library/Mail/.putting-back-Accounts.plist", "half");

  keep();

  EXPECT_THAT(entriesOfTheHost(), IsEmpty());
  EXPECT_THAT(device.fileSystem.files, IsEmpty());
}

TEST_F(KeepingInputsTest, OtherThingsInTheHostsDirectoryStay) {
  device.fileSystem.addFile(folderPath("notes.txt"), "of a person");
  device.fileSystem.addFile(folderPath("Unfinished-note"), "of a person");

  keep();

  EXPECT_EQ(device.fileSystem.files.size(), 2u);
}

TEST_F(KeepingInputsTest, AnythingButARegularFileIsRefusedWithNothingTouched) {
  for (const std::string_view path : {kSettingsPath, kLegacyMailPath, kLegacyExchangePath}) {
    FakePlatform other;
    other.fileSystem.otherEntries.insert(std::string(path));
    SafetyNet guard(other.fileSystem, other.propertyLists, accountFilesInHome("/var/mobile"), "");

    const Result result = guard.keepInputs(kTime);

    ASSERT_FALSE(result);
    EXPECT_EQ(result.error(), std::string(path) + " is no regular file");
    EXPECT_FALSE(other.fileSystem.directories.contains("/var/mobile/Library/AccountMigration"));
  }
}

TEST_F(KeepingInputsTest, AnInputThatCannotBeLookedAtIsNotTakenForAMissingOne) {
  addSettings(11);
  device.fileSystem.failWhenLineBegins("kindOfEntry " + std::string(kSettingsPath));

  EXPECT_FALSE(net.keepInputs(kTime));

  EXPECT_THAT(entriesOfTheHost(), IsEmpty());
}

TEST_F(KeepingInputsTest, NoFaultLosesAFileOrLeavesAFolderWithItsName) {
  const auto prepare = [](FakePlatform& platform) {
    for (const std::string_view path : {kSettingsPath, kLegacyMailPath, kLegacyExchangePath}) {
      platform.fileSystem.addFile(path, path);
    }
  };
  const auto run = [](FakePlatform& platform) {
    return static_cast<bool>(SafetyNet(platform.fileSystem, platform.propertyLists,
                                       accountFilesInHome("/var/mobile"), "")
                                 .keepInputs(kTime));
  };
  FakePlatform whole;
  prepare(whole);
  ASSERT_TRUE(run(whole));

  for (std::size_t operation = 0; operation < whole.fileSystem.operationCount(); ++operation) {
    FakePlatform faulty;
    prepare(faulty);
    faulty.fileSystem.failAt(operation);

    const bool isKept = run(faulty);

    for (const std::string_view path : {kSettingsPath, kLegacyMailPath, kLegacyExchangePath}) {
      EXPECT_EQ(faulty.fileSystem.contentsOf(path), path) << operation;
    }
    const auto keptFiles = std::ranges::count_if(faulty.fileSystem.files, [](const auto& file) {
      return file.first.starts_with(folderPath("Kept-"));
    });
    EXPECT_EQ(keptFiles, isKept ? 3 : 0) << operation;
  }
}

TEST_F(KeepingInputsTest, ARunKilledAnywhereLeavesAWholeFolderOrNone) {
  addSettings(11);
  addLegacyMail();
  for (std::size_t operation = 0;; ++operation) {
    FakePlatform killed;
    killed.fileSystem.files = device.fileSystem.files;
    killed.fileSystem.stopBefore(operation);
    SafetyNet guard(killed.fileSystem, killed.propertyLists, accountFilesInHome("/var/mobile"), "");
    try {
      ASSERT_TRUE(guard.keepInputs(kTime));
      break;
    } catch (const WorldStopped&) {
    }
    if (killed.fileSystem.directories.contains(folder)) {
      EXPECT_TRUE(killed.fileSystem.files.contains(kept(kSettingsPath))) << operation;
      EXPECT_TRUE(killed.fileSystem.files.contains(kept(kLegacyMailPath))) << operation;
    }
  }
}

}  // namespace
}  // namespace accounts
