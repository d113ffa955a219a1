#include "safetynet/Restoration.h"

#include "tests/safetynet/SafetyNetFixture.h"

namespace accounts {
namespace {

using testing::ElementsAre;
using testing::IsEmpty;

class RestorationTest : public SafetyNetTest {
 protected:
  RestorationTest() {
    device.fileSystem.addFile(kept(kSettingsPath), "kept settings");
    device.fileSystem.addFile(kept(kLegacyMailPath), "kept mail");
  }

  Restoration restore(const std::optional<std::string>& from = std::nullopt) {
    return restoreKeptFiles(device.fileSystem, accountFilesInHome("/var/mobile"), from, kTime);
  }
  void expectError(const Restoration& restoration, ExitStatus exitStatus,
                   const std::string& message) {
    ASSERT_TRUE(restoration.error);
    EXPECT_EQ(restoration.error->exitStatus, exitStatus);
    EXPECT_EQ(restoration.error->message, message);
    EXPECT_THAT(restoration.restored, IsEmpty());
  }

  const std::string replaced = folderPath("Replaced-20260102T030405Z-2");
};

TEST_F(RestorationTest, TheFilesAreBackAndTheFolderIsGone) {
  const Restoration restoration = restore();

  EXPECT_FALSE(restoration.error);
  EXPECT_EQ(restoration.folder, folder);
  EXPECT_THAT(restoration.restored, ElementsAre(kLegacyMailPath, kSettingsPath));
  EXPECT_EQ(contentsOf(kSettingsPath), "kept settings");
  EXPECT_EQ(contentsOf(kLegacyMailPath), "kept mail");
  EXPECT_EQ(restoration.replaced, std::nullopt);
  EXPECT_THAT(entriesOfTheHost(), IsEmpty());
}

TEST_F(RestorationTest, WhatIsReplacedIsKept) {
  device.fileSystem.addFile(kSettingsPath, "newer settings");

  const Restoration restoration = restore();

  EXPECT_FALSE(restoration.error);
  EXPECT_EQ(restoration.replaced, replaced);
  EXPECT_EQ(contentsOf(replaced + "/com.quarx.accountsettings.plist"), "newer settings");
  EXPECT_EQ(contentsOf(kSettingsPath), "kept settings");
}

TEST_F(RestorationTest, WhatWasReplacedCanBePutBackInTurn) {
  device.fileSystem.addFile(kSettingsPath, "newer settings");
  ASSERT_FALSE(restore().error);

  EXPECT_FALSE(restore(std::string(nameOf(replaced))).error);

  EXPECT_EQ(contentsOf(kSettingsPath), "newer settings");
}

TEST_F(RestorationTest, AFileThatTheFolderDoesNotHoldStays) {
  device.fileSystem.addFile(kLegacyExchangePath, "newer Exchange accounts");

  ASSERT_FALSE(restore().error);

  EXPECT_EQ(contentsOf(kLegacyExchangePath), "newer Exchange accounts");
}

TEST_F(RestorationTest, ASentinelGoesSoThatTheNextMigrationConvertsTheStores) {
  device.fileSystem.addFile(kSentinelPath, "the removal had begun");

  ASSERT_FALSE(restore().error);

  EXPECT_FALSE(exists(kSentinelPath));
}

TEST_F(RestorationTest, AFolderIsNamedByItsNameOrItsPath) {
  device.fileSystem.addFile(folderPath("Kept-20250101T000000Z/Accounts.plist"), "older");
  ASSERT_FALSE(restore("Kept-20250101T000000Z").error);
  EXPECT_EQ(contentsOf(kLegacyMailPath), "older");

  ASSERT_FALSE(restore(folder).error);
  EXPECT_EQ(contentsOf(kLegacyMailPath), "kept mail");
}

TEST_F(RestorationTest, AmongSeveralFoldersOneMustBeNamed) {
  device.fileSystem.addFile(folderPath("Kept-20250101T000000Z/Accounts.plist"), "older");
  const auto before = device.fileSystem.files.size();

  expectError(restore(), ExitStatus::UnusableArguments,
              "Several folders hold kept files, --from must name one: Kept-20250101T000000Z "
              "Kept-20260102T030405Z");

  EXPECT_EQ(device.fileSystem.files.size(), before);
}

TEST_F(RestorationTest, NothingKeptIsAnError) {
  device.fileSystem.files.clear();
  device.fileSystem.directories.erase(folder);

  expectError(restore(), ExitStatus::MissingInput,
              "No files are kept in /var/mobile/Library/AccountMigration");
}

TEST_F(RestorationTest, OnlyAFolderOfKeptFilesIsTaken) {
  device.fileSystem.addFile("/elsewhere/Kept-1/Accounts.plist", "elsewhere");
  device.fileSystem.addFile(folderPath("Other-1/Accounts.plist"), "other");
  device.fileSystem.addFile(folderPath("Unfinished-1/Accounts.plist"), "unfinished");
  for (const char* name : {"Kept-missing", "/elsewhere/Kept-1", "Other-1", "Unfinished-1", "..",
                           "Kept-20260102T030405Z/", "/"}) {
    expectError(restore(name), ExitStatus::MissingInput,
                std::string("No folder of kept files: ") + name);
  }
  EXPECT_TRUE(isKept());
}

TEST_F(RestorationTest, AFolderWithoutKeptFilesIsAnErrorAndStays) {
  device.fileSystem.addDirectory(folderPath("Kept-1"));

  expectError(restore("Kept-1"), ExitStatus::MissingInput,
              "No kept files in " + folderPath("Kept-1"));

  EXPECT_TRUE(device.fileSystem.directories.contains(folderPath("Kept-1")));
}

TEST_F(RestorationTest, SomethingElseInTheFileSPlaceIsNotReplaced) {
  device.fileSystem.otherEntries.insert(std::string(kSettingsPath));

  expectError(restore(), ExitStatus::CannotCreate,
              std::string(kSettingsPath) + " is no regular file, so it is not replaced");

  EXPECT_FALSE(exists(kLegacyMailPath));
}

TEST_F(RestorationTest, WithoutAPlaceForWhatIsReplacedNothingIsReplaced) {
  device.fileSystem.addFile(kSettingsPath, "newer settings");
  device.fileSystem.failWhenLineBegins("createDirectory ");

  const Restoration restoration = restore();

  ASSERT_TRUE(restoration.error);
  EXPECT_EQ(restoration.error->exitStatus, ExitStatus::CannotCreate);
  EXPECT_EQ(contentsOf(kSettingsPath), "newer settings");
  EXPECT_FALSE(exists(kLegacyMailPath));
  EXPECT_TRUE(isKept());
}

TEST_F(RestorationTest, AFailureLeavesTheFolderWhole) {
  device.fileSystem.failWhenLineBegins("rename ");

  const Restoration restoration = restore();

  ASSERT_TRUE(restoration.error);
  EXPECT_EQ(restoration.error->exitStatus, ExitStatus::InputOutputError);
  EXPECT_EQ(contentsOf(kept(kSettingsPath)), "kept settings");
  EXPECT_EQ(contentsOf(kept(kLegacyMailPath)), "kept mail");
}

TEST_F(RestorationTest, KilledAnywhereItCanBeRunAgain) {
  device.fileSystem.addFile(kSettingsPath, "newer settings");
  const FakePlatform prepared = device;
  bool isKilled = true;
  for (std::size_t operation = 0; isKilled; ++operation) {
    SCOPED_TRACE(operation);
    FakePlatform killed;
    killed.fileSystem.files = prepared.fileSystem.files;
    killed.fileSystem.directories = prepared.fileSystem.directories;
    killed.fileSystem.stopBefore(operation);
    const auto run = [&] {
      return restoreKeptFiles(killed.fileSystem, accountFilesInHome("/var/mobile"), std::nullopt,
                              kTime);
    };
    try {
      static_cast<void>(run());
      isKilled = false;
    } catch (const WorldStopped&) {
      killed.fileSystem.removeFaults();
      // The folder is gone only when everything was back.
      const Restoration again = run();
      EXPECT_TRUE(!again.error || again.error->exitStatus == ExitStatus::MissingInput);
    }
    EXPECT_EQ(killed.fileSystem.contentsOf(kSettingsPath), "kept settings");
    EXPECT_EQ(killed.fileSystem.contentsOf(kLegacyMailPath), "kept mail");
    EXPECT_EQ(killed.fileSystem.contentsOf(replaced + "/com.quarx.accountsettings.plist"),
              "newer settings");
  }
}

}  // namespace
}  // namespace accounts
