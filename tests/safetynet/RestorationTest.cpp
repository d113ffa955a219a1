#include "safetynet/Restoration.h"

#include <gmock/gmock.h>
#include <gtest/gtest.h>

#include "tests/safetynet/FakeDevice.h"

namespace accounts {
namespace {

using testing::ElementsAre;
using testing::HasSubstr;
using testing::IsEmpty;

constexpr std::string_view kTime = "20260102T030405Z";
constexpr DevicePlace kSettings = DevicePlace::Settings;
constexpr DevicePlace kMail = DevicePlace::LegacyMail;
constexpr DevicePlace kExchange = DevicePlace::LegacyExchange;

/// A device with a folder that has settings and a mail store, and says that no Exchange store stood
/// there.
class RestorationTest : public testing::Test {
 protected:
  RestorationTest() {
    device.write(kAccountMigrationDirectory, "", EntryKind::Directory);
    addFolder("Kept-20260102T030405Z",
              "file\tSettings\nfile\tLegacyMail\nnothing\tLegacyExchange\n");
    device.write(folder + "/Settings", "kept settings");
    device.write(folder + "/LegacyMail", "kept mail");
  }

  static std::string folderPath(std::string_view name) {
    return std::string(kAccountMigrationDirectory) + "/" + std::string(name);
  }
  static std::string path(DevicePlace place) { return FakeDevice::pathOf(place); }
  void addFolder(const std::string& name, std::string list) {
    device.write(folderPath(name), "", EntryKind::Directory);
    device.write(folderPath(name) + "/List", std::move(list));
  }
  static Restoration restore(FakeDevice& on, const std::optional<std::string>& from = {}) {
    KeptFolders folders(on, on);
    return restoreKeptFiles(on, folders, "/var/mobile", from, kTime);
  }
  Restoration restore(const std::optional<std::string>& from = {}) { return restore(device, from); }
  void expectError(const Restoration& restoration, ExitStatus exitStatus,
                   const std::string& message) {
    ASSERT_TRUE(restoration.error);
    EXPECT_EQ(restoration.error->exitStatus, exitStatus);
    EXPECT_EQ(restoration.error->message, message);
    EXPECT_THAT(restoration.restored, IsEmpty());
  }

  FakeDevice device;
  const std::string folder = folderPath("Kept-20260102T030405Z");
  const std::string replaced = folderPath("Replaced-20260102T030405Z-2");
};

TEST_F(RestorationTest, TheFilesAreBackAndTheFolderIsGone) {
  const Restoration restoration = restore();
  EXPECT_FALSE(restoration.error);
  EXPECT_EQ(restoration.folder, folder);
  EXPECT_THAT(restoration.restored, ElementsAre(path(kMail), path(kSettings)));
  EXPECT_EQ(device.at(kSettings), "kept settings");
  EXPECT_EQ(device.at(kMail), "kept mail");
  EXPECT_EQ(restoration.replaced, std::nullopt);
  EXPECT_THAT(device.keptNames(), IsEmpty());
}

TEST_F(RestorationTest, TheSettingsFileComesLastAndEachNameIsOnTheMediumBeforeTheNext) {
  ASSERT_FALSE(restore().error);
  std::vector<std::string> lines;
  for (const std::string& line : device.journal) {
    if (line.starts_with("put") || line.starts_with("flush") ||
        line.starts_with("renameDirectory")) {
      lines.push_back(line.substr(0, line.find(" /")));
    }
  }
  EXPECT_THAT(lines, ElementsAre("put LegacyMail", "flush LegacyMail", "put Settings",
                                 "flush Settings", "renameDirectory"));
}

TEST_F(RestorationTest, WhatIsReplacedIsKept) {
  device.write(kSettings, "newer settings");
  const Restoration restoration = restore();
  EXPECT_FALSE(restoration.error);
  EXPECT_EQ(restoration.replaced, replaced);
  EXPECT_EQ(device.at(replaced + "/Settings"), "newer settings");
  EXPECT_EQ(device.at(kSettings), "kept settings");
}

TEST_F(RestorationTest, APlaceWhereNothingStoodIsEmptyAgainAndWhatStoodThereIsKept) {
  device.write(kExchange, "newer store");
  const Restoration restoration = restore();
  EXPECT_FALSE(restoration.error);
  EXPECT_FALSE(device.exists(kExchange));
  EXPECT_EQ(device.at(replaced + "/LegacyExchange"), "newer store");
  EXPECT_THAT(restoration.restored, ElementsAre(path(kMail), path(kSettings)));
  EXPECT_THAT(restoration.removed, ElementsAre(path(kExchange)));
}

TEST_F(RestorationTest, WhatWasReplacedCanBePutBackInTurn) {
  device.write(kSettings, "newer settings");
  device.write(kExchange, "newer store");
  ASSERT_FALSE(restore().error);

  EXPECT_FALSE(restore("Replaced-20260102T030405Z-2").error);

  EXPECT_EQ(device.at(kSettings), "newer settings");
  EXPECT_EQ(device.at(kExchange), "newer store");
  EXPECT_FALSE(device.exists(kMail)) << "which stood not there before";
}

TEST_F(RestorationTest, APlaceThatTheFolderDoesNotListStays) {
  device.write(DevicePlace::CopyAside, "of an engineer");
  ASSERT_FALSE(restore().error);
  EXPECT_EQ(device.at(DevicePlace::CopyAside), "of an engineer");
}

TEST_F(RestorationTest, RecordAndSentinelEndBeforeAnythingComesBack) {
  device.write(DevicePlace::CommitRecord, "record");
  device.write(DevicePlace::RemovalSentinel, "removing");
  ASSERT_FALSE(restore().error);
  EXPECT_FALSE(device.exists(DevicePlace::CommitRecord));
  EXPECT_FALSE(device.exists(DevicePlace::RemovalSentinel));
  const auto position = [&](std::string_view line) {
    return std::ranges::find(device.journal, line) - device.journal.begin();
  };
  EXPECT_LT(position("flush CommitRecord"), position("put LegacyMail"));
  EXPECT_LT(position("flush RemovalSentinel"), position("put LegacyMail"));
}

TEST_F(RestorationTest, ARecordThatCannotEndLeavesEverything) {
  device.write(DevicePlace::CommitRecord, "record");
  device.write(kSettings, "newer settings");
  device.failWhenLineBegins("remove CommitRecord");
  const Restoration restoration = restore();
  ASSERT_TRUE(restoration.error);
  EXPECT_EQ(restoration.error->exitStatus, ExitStatus::InputOutputError);
  EXPECT_EQ(restoration.error->message, "Not everything could be put back, " + folder +
                                            " is still whole: Cannot remove CommitRecord");
  EXPECT_EQ(device.at(kSettings), "newer settings");
}

TEST_F(RestorationTest, AFolderIsNamedByItsNameOrItsPath) {
  addFolder("Kept-20250101T000000Z", "file\tLegacyMail\n");
  device.write(folderPath("Kept-20250101T000000Z/LegacyMail"), "older");
  ASSERT_FALSE(restore("Kept-20250101T000000Z").error);
  EXPECT_EQ(device.at(kMail), "older");
  ASSERT_FALSE(restore(folder).error);
  EXPECT_EQ(device.at(kMail), "kept mail");
}

TEST_F(RestorationTest, AmongSeveralFoldersOneMustBeNamed) {
  addFolder("Kept-20250101T000000Z", "file\tLegacyMail\n");
  const auto before = device.contents();
  expectError(restore(), ExitStatus::UnusableArguments,
              "Several folders hold kept files, --from must name one: Kept-20250101T000000Z "
              "Kept-20260102T030405Z");
  EXPECT_EQ(device.contents(), before);
}

TEST_F(RestorationTest, NothingKeptIsAnError) {
  FakeDevice empty;
  expectError(restore(empty), ExitStatus::MissingInput,
              "No files are kept in /var/mobile/Library/AccountMigration");
}

TEST_F(RestorationTest, OnlyAFolderOfKeptFilesIsTaken) {
  device.write("/elsewhere/Kept-1", "", EntryKind::Directory);
  addFolder("Other-1", "file\tSettings\n");
  addFolder("Unfinished-1", "file\tSettings\n");
  for (const char* name : {"Kept-missing", "/elsewhere/Kept-1", "/elsewhere/Kept-20260102T030405Z",
                           "Other-1", "Unfinished-1", "..", "Kept-20260102T030405Z/", "/", ""}) {
    expectError(restore(name), ExitStatus::MissingInput,
                std::string("No folder of kept files: ") + name);
  }
  EXPECT_EQ(device.at(folder + "/Settings"), "kept settings");
}

TEST_F(RestorationTest, AFolderWithoutAListIsAnErrorAndStays) {
  for (const char* list : {"", "no list"}) {
    addFolder("Kept-1", list);
    expectError(restore("Kept-1"), ExitStatus::MissingInput,
                "No kept files in " + folderPath("Kept-1"));
    EXPECT_TRUE(device.entries.contains(folderPath("Kept-1")));
  }
}

TEST_F(RestorationTest, ADirectoryInAFilesPlaceIsNotReplaced) {
  device.write(path(kSettings), "", EntryKind::Directory);
  expectError(restore(), ExitStatus::CannotCreate,
              path(kSettings) + " is a directory, so it is not replaced");
  EXPECT_FALSE(device.exists(kMail));
}

TEST_F(RestorationTest, WithoutAPlaceForWhatIsReplacedNothingIsReplaced) {
  device.write(kSettings, "newer settings");
  device.failWhenLineBegins("createDirectory ");
  const Restoration restoration = restore();
  ASSERT_TRUE(restoration.error);
  EXPECT_EQ(restoration.error->exitStatus, ExitStatus::InputOutputError);
  EXPECT_THAT(restoration.error->message, HasSubstr("What would be replaced cannot be kept: "));
  EXPECT_EQ(device.at(kSettings), "newer settings");
  EXPECT_FALSE(device.exists(kMail));
  EXPECT_EQ(device.at(folder + "/Settings"), "kept settings");
}

TEST_F(RestorationTest, AnyFailureLeavesTheFolderWholeOrEverythingBack) {
  device.write(kSettings, "newer settings");
  FakeDevice whole = device.copy();
  ASSERT_FALSE(restore(whole).error);
  for (std::size_t operation = 0; operation < whole.operationCount(); ++operation) {
    SCOPED_TRACE(operation);
    FakeDevice faulty = device.copy();
    faulty.failAt(operation);
    const Restoration restoration = restore(faulty);
    const bool isBack = faulty.at(kSettings) == "kept settings";
    EXPECT_TRUE(isBack || restoration.error);
    if (restoration.error && faulty.entries.contains(folder)) {
      EXPECT_EQ(faulty.at(folder + "/Settings"), "kept settings");
      EXPECT_EQ(faulty.at(folder + "/LegacyMail"), "kept mail");
    }
    if (isBack) {
      ASSERT_TRUE(restoration.replaced) << "what is replaced is never lost";
      EXPECT_EQ(faulty.at(*restoration.replaced + "/Settings"), "newer settings");
    }
  }
}

TEST_F(RestorationTest, AFolderThatStaysWhenAllIsBackIsTold) {
  device.failWhenLineBegins("renameDirectory " + folder);
  const Restoration restoration = restore();
  ASSERT_TRUE(restoration.error);
  EXPECT_EQ(restoration.error->exitStatus, ExitStatus::InputOutputError);
  EXPECT_THAT(restoration.error->message,
              HasSubstr("Everything is put back, but the folder cannot be removed: Cannot rename"));
  EXPECT_EQ(device.at(kSettings), "kept settings");
}

TEST_F(RestorationTest, AnotherProgramsFileIsNotReplacedUnseen) {
  device.before = [&](const std::string& line) {
    if (line == "put Settings") {
      device.write(kSettings, "of another program");
    }
  };
  const Restoration restoration = restore();
  ASSERT_TRUE(restoration.error);
  EXPECT_THAT(restoration.error->message, HasSubstr("Another program wrote meanwhile"));
  EXPECT_EQ(device.at(kSettings), "of another program");
  EXPECT_EQ(device.at(folder + "/Settings"), "kept settings");
}

TEST_F(RestorationTest, KilledAnywhereItCanBeRunAgain) {
  device.write(kSettings, "newer settings");
  device.write(kExchange, "newer store");
  bool isKilled = true;
  for (std::size_t operation = 0; isKilled; ++operation) {
    SCOPED_TRACE(operation);
    FakeDevice killed = device.copy();
    killed.stopBefore(operation);
    try {
      static_cast<void>(restore(killed));
      isKilled = false;
    } catch (const WorldStopped&) {
      killed.removeFaults();
      // The folder is gone only when everything was back.
      const Restoration again = restore(killed);
      EXPECT_TRUE(!again.error || again.error->exitStatus == ExitStatus::MissingInput)
          << again.error->message;
    }
    EXPECT_EQ(killed.at(kSettings), "kept settings");
    EXPECT_EQ(killed.at(kMail), "kept mail");
    EXPECT_FALSE(killed.exists(kExchange));
    EXPECT_EQ(killed.at(replaced + "/Settings"), "newer settings");
    EXPECT_EQ(killed.at(replaced + "/LegacyExchange"), "newer store");
  }
}

}  // namespace
}  // namespace accounts
