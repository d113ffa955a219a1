#include "safetynet/KeptFolders.h"

#include <gmock/gmock.h>
#include <gtest/gtest.h>

#include "tests/safetynet/FakeDevice.h"

namespace accounts {
namespace {

using testing::ElementsAre;
using testing::IsEmpty;

constexpr std::string_view kTime = "20260102T030405Z";
constexpr DevicePlace kSettings = DevicePlace::Settings;
constexpr DevicePlace kMail = DevicePlace::LegacyMail;

class KeptFoldersTest : public testing::Test {
 protected:
  static std::string folderPath(std::string_view name) {
    return std::string(kAccountMigrationDirectory) + "/" + std::string(name);
  }
  static FileIdentity identity(FakeDevice& device, DevicePlace place) {
    return device.identityAt(place).value();
  }
  static std::vector<PlaceToKeep> toKeep(FakeDevice& device) {
    return {{kSettings, identity(device, kSettings)}, {kMail, identity(device, kMail)}};
  }
  /// Keeps the settings file and the mail store; the folder, or why there is none.
  std::string keep(KeptFor purpose = KeptFor::Migration) {
    std::string made;
    const PlaceOutcome outcome = folders.keep(toKeep(device), purpose, kTime, made);
    return outcome.isDone()                                ? made
           : outcome.kind == PlaceOutcome::Kind::Disturbed ? "disturbed"
                                                           : outcome.failure.text;
  }

  /// What the folder says of itself.
  KeptList list() { return folders.listOf(folder).value().value_or(KeptList()); }

  FakeDevice device;
  KeptFolders folders{device, device};
  const std::string folder = folderPath("Kept-20260102T030405Z");
};

TEST_F(KeptFoldersTest, WhatStandsIsKeptUnderTheNameOfItsPlace) {
  device.write(kSettings, "settings");
  device.write(kMail, "store");

  EXPECT_EQ(keep(), folder);

  EXPECT_EQ(device.at(folder + "/Settings"), "settings");
  EXPECT_EQ(device.at(folder + "/LegacyMail"), "store");
  EXPECT_EQ(device.entries.at(folder)->identity.mode, 0700u);
}

TEST_F(KeptFoldersTest, EverybodyMayListTheDirectoryAndOnlyItsOwnerReadAFolder) {
  device.write(kSettings, "settings");
  ASSERT_EQ(keep(), folder);
  EXPECT_EQ(device.entries.at(std::string(kAccountMigrationDirectory))->identity.mode & 07777U,
            0755U);
  EXPECT_EQ(device.entries.at(folder)->identity.mode & 07777U, 0700U);
}

TEST_F(KeptFoldersTest, AFolderThatIsDiscardedIsAnUnfinishedOneBeforeAnythingInItGoes) {
  device.write(kSettings, "settings");
  ASSERT_EQ(keep(), folder);
  device.journal.clear();
  EXPECT_TRUE(folders.discard(folder));
  EXPECT_EQ(device.journal.at(0),
            "renameDirectory " + folder + " -> " + folderPath("Unfinished-20260102T030405Z"));
}

TEST_F(KeptFoldersTest, AFolderThatIsGoneIsDiscarded) {
  EXPECT_TRUE(folders.discard(folder));
}

TEST_F(KeptFoldersTest, AListSaysWhatStoodAtEachPlaceNothingIncluded) {
  device.write(kSettings, "settings");
  ASSERT_EQ(keep(), folder);
  EXPECT_EQ(device.at(folder + "/List"), "kept on request\nfile\tSettings\nnothing\tLegacyMail\n");
  EXPECT_EQ(list().reason, KeptFor::Migration);
  EXPECT_EQ(list().places,
            (KeptPlaces{{kSettings, EntryKind::RegularFile}, {kMail, EntryKind::Nothing}}));
}

TEST_F(KeptFoldersTest, ALinkIsKeptAndADirectoryIsOnlyListed) {
  device.write(FakeDevice::pathOf(kSettings), "link", EntryKind::Other);
  device.write(FakeDevice::pathOf(kMail), "", EntryKind::Directory);
  ASSERT_EQ(keep(), folder);
  EXPECT_EQ(device.at(folder + "/Settings"), "link");
  EXPECT_FALSE(device.entries.contains(folder + "/LegacyMail"));
  EXPECT_EQ(list().places,
            (KeptPlaces{{kSettings, EntryKind::Other}, {kMail, EntryKind::Directory}}));
}

TEST_F(KeptFoldersTest, EverythingIsOnTheMediumBeforeTheFolderHasItsName) {
  device.write(kSettings, "settings");
  ASSERT_EQ(keep(), folder);
  const std::string unfinished = folderPath("Unfinished-20260102T030405Z");
  EXPECT_THAT(
      device.journal,
      ElementsAre("createDirectory /var/mobile/Library/AccountMigration",
                  "synchronizeDirectory /var/mobile/Library", "synchronizeDirectory /var/mobile",
                  "synchronizeDirectory /var", "createDirectory " + unfinished,
                  "keep Settings -> " + unfinished + "/Settings",
                  "createFile " + unfinished + "/List", "synchronizeDirectory " + unfinished,
                  "renameDirectory " + unfinished + " -> " + folder));
}

TEST_F(KeptFoldersTest, AFolderThatExistsIsNeverTouched) {
  device.write(kSettings, "settings");
  for (const char* taken :
       {"Kept-20260102T030405Z", "Replaced-20260102T030405Z-2", "Unfinished-20260102T030405Z-3"}) {
    device.write(folderPath(taken), "", EntryKind::Directory);
  }
  EXPECT_EQ(keep(), folder + "-4");
}

TEST_F(KeptFoldersTest, AFileThatAnotherProgramWroteMeanwhileIsNotKept) {
  device.write(kSettings, "settings");
  device.before = [&](const std::string& line) {
    if (line.starts_with("keep Settings")) {
      device.write(kSettings, "of another program");
    }
  };
  EXPECT_EQ(keep(), "disturbed");
  EXPECT_THAT(device.keptNames(), IsEmpty());
  EXPECT_FALSE(device.entries.contains(kAccountMigrationDirectory));
}

TEST_F(KeptFoldersTest, FoldersAreListedByPurposeOldestFirst) {
  device.write(kAccountMigrationDirectory, "", EntryKind::Directory);
  for (const char* name :
       {"Kept-2", "Kept-1", "Replaced-3", "Unfinished-4", "Other-5", "CommitRecord"}) {
    device.write(folderPath(name), "", EntryKind::Directory);
  }
  device.write(folderPath("Kept-0"), "a file");
  EXPECT_THAT(folders.keptFor(KeptFor::Migration).value(),
              ElementsAre(folderPath("Kept-1"), folderPath("Kept-2")));
  EXPECT_THAT(folders.keptFor(KeptFor::Restoration).value(), ElementsAre(folderPath("Replaced-3")));
  EXPECT_TRUE(folders.contains("Replaced-3").value());
  EXPECT_FALSE(folders.contains("Unfinished-4").value());
  EXPECT_FALSE(folders.contains("Kept-0").value());
  EXPECT_FALSE(folders.contains("Kept-missing").value());
}

TEST_F(KeptFoldersTest, ADiscardedFolderIsGoneWithTheDirectoryThatWasMadeForIt) {
  device.write(kSettings, "settings");
  ASSERT_EQ(keep(), folder);
  EXPECT_TRUE(folders.discard(folder));
  EXPECT_FALSE(device.entries.contains(kAccountMigrationDirectory));
  EXPECT_EQ(device.at(kSettings), "settings");
}

TEST_F(KeptFoldersTest, TheDirectoryOfAnEarlierRunStays) {
  device.write(kAccountMigrationDirectory, "", EntryKind::Directory);
  device.write(kSettings, "settings");
  ASSERT_EQ(keep(), folder);
  EXPECT_TRUE(folders.discard(folder));
  EXPECT_TRUE(device.entries.contains(kAccountMigrationDirectory));
  EXPECT_THAT(device.keptNames(), IsEmpty());
}

TEST_F(KeptFoldersTest, AFolderThatCannotBeDiscardedIsWhole) {
  device.write(kSettings, "settings");
  ASSERT_EQ(keep(), folder);
  device.failWhenLineBegins("renameDirectory ");
  EXPECT_FALSE(folders.discard(folder));
  EXPECT_EQ(device.at(folder + "/Settings"), "settings");
  EXPECT_TRUE(folders.listOf(folder).value());
}

TEST_F(KeptFoldersTest, WhatKilledRunsLeftUnfinishedIsRemovedAndNothingElse) {
  device.write(kAccountMigrationDirectory, "", EntryKind::Directory);
  device.write(folderPath("Unfinished-1"), "", EntryKind::Directory);
  device.write(folderPath("Unfinished-1/Settings"), "half");
  device.write(folderPath("Unfinished-note"), "of a person");
  device.write(folderPath("Kept-1"), "", EntryKind::Directory);
  folders.removeUnfinished();
  EXPECT_THAT(device.keptNames(), ElementsAre("Kept-1", "Unfinished-note"));
}

TEST_F(KeptFoldersTest, AListThatIsNoneIsNone) {
  EXPECT_FALSE(folders.listOf(folder).value());
  for (const char* text :
       {"file\tSettings", "file Settings\n", "File\tSettings\n", "file\tSettings\n\n",
        "file\tNowhere\n", "file\tSettings\nnothing\tSettings\n", "\tSettings\n", "\n"}) {
    device.write(folder + "/List", text);
    EXPECT_FALSE(folders.listOf(folder).value()) << text;
  }
  device.write(folder + "/List", std::string(5000, 'x'));
  EXPECT_FALSE(folders.listOf(folder).value());
}

TEST_F(KeptFoldersTest, WhatCannotBeToldAtTheMomentIsNotNothing) {
  device.write(kSettings, "settings");
  ASSERT_EQ(keep(), folder);
  const std::string name = folder.substr(folder.rfind('/') + 1);
  const auto failing = [this](const char* operation) {
    device.removeFaults();
    device.failWhenLineBegins(operation, ENFILE);
  };
  failing("directoryEntries ");
  EXPECT_FALSE(folders.keptFor(KeptFor::Migration));
  failing("kindOfEntry ");
  EXPECT_FALSE(folders.keptFor(KeptFor::Migration));
  EXPECT_FALSE(folders.contains(name));
  failing("shortContents ");
  EXPECT_FALSE(folders.listOf(folder));
}

TEST_F(KeptFoldersTest, NoFaultLosesAFileOrLeavesAFolder) {
  device.write(kSettings, "settings");
  device.write(kMail, "store");
  FakeDevice whole = device.copy();
  std::string kept;
  ASSERT_TRUE(
      KeptFolders(whole, whole).keep(toKeep(whole), KeptFor::Migration, kTime, kept).isDone());

  for (std::size_t operation = 2; operation < whole.operationCount(); ++operation) {
    SCOPED_TRACE(operation);
    FakeDevice faulty = device.copy();
    faulty.failAt(operation);
    std::string made;
    const bool isKept =
        KeptFolders(faulty, faulty).keep(toKeep(faulty), KeptFor::Migration, kTime, made).isDone();
    EXPECT_EQ(faulty.at(kSettings), "settings");
    EXPECT_EQ(faulty.at(kMail), "store");
    EXPECT_EQ(!made.empty(), isKept);
    EXPECT_EQ(faulty.at(folder + "/Settings"), isKept && made == folder ? "settings" : "(nothing)");
  }
}

TEST_F(KeptFoldersTest, AFolderThatHasItsNameButMayLoseItAgainIsRemoved) {
  device.write(kSettings, "settings");
  // The name is given, and only the flush after that fails.
  device.before = [&](const std::string& line) {
    if (line.starts_with("renameDirectory ")) {
      device.before = nullptr;
      device.removeFaults();
      ASSERT_TRUE(device.renameDirectory(folderPath("Unfinished-" + std::string(kTime)), folder));
      device.failWhenLineBegins("renameDirectory " + folderPath("Unfinished-"));
    }
  };
  std::string made;
  device.failWhenLineBegins("renameDirectory " + folderPath("Unfinished-"));
  EXPECT_FALSE(folders.keep(toKeep(device), KeptFor::Migration, kTime, made).isDone());
  EXPECT_EQ(made, "");
  EXPECT_THAT(device.keptNames(), IsEmpty());
}

TEST_F(KeptFoldersTest, ARunThatIsKilledAnywhereLeavesAWholeFolderOrNone) {
  device.write(kSettings, "settings");
  device.write(kMail, "store");
  bool isKilled = true;
  for (std::size_t operation = 2; isKilled; ++operation) {
    SCOPED_TRACE(operation);
    FakeDevice killed = device.copy();
    killed.stopBefore(operation);
    std::string made;
    try {
      static_cast<void>(
          KeptFolders(killed, killed).keep(toKeep(killed), KeptFor::Migration, kTime, made));
      isKilled = false;
    } catch (const WorldStopped&) {
    }
    if (killed.entries.contains(folder)) {
      EXPECT_EQ(killed.at(folder + "/Settings"), "settings");
      EXPECT_EQ(killed.at(folder + "/LegacyMail"), "store");
      killed.removeFaults();
      EXPECT_TRUE(KeptFolders(killed, killed).listOf(folder).value());
    }
  }
}

}  // namespace
}  // namespace accounts
