#include "tests/safetynet/CommitFixture.h"

namespace accounts {
namespace {

using testing::ElementsAre;
using testing::HasSubstr;
using testing::IsEmpty;
using Kind = CommitOutcome::Kind;

TEST_F(CommitTest, EverythingIsDoneInItsOrder) {
  const CommitOutcome outcome = commit();

  EXPECT_EQ(outcome.kind, Kind::Done);
  EXPECT_THAT(outcome.warnings, IsEmpty());
  EXPECT_THAT(
      device.journal,
      ElementsAre("stage Settings", "createDirectory /var/mobile/Library/AccountMigration",
                  "synchronizeDirectory /var/mobile/Library", "synchronizeDirectory /var/mobile",
                  "synchronizeDirectory /var", "stage CommitRecord", "put CommitRecord",
                  "flush CommitRecord", "put Settings", "flush Settings", "stage RemovalSentinel",
                  "put RemovalSentinel", "flush RemovalSentinel", "remove LegacyExchange",
                  "remove LegacyExchangeOriginal", "flush LegacyExchange", "remove LegacyMail",
                  "remove LegacyMailOriginal", "flush LegacyMail", "remove RemovalSentinel",
                  "flush RemovalSentinel", "stage CopyAside", "put CopyAside",
                  "remove AutoFetchEnabled",
                  "writeInformationFile AccountMigrationInformation-1.txt", "remove CommitRecord",
                  "removeDirectory /var/mobile/Library/AccountMigration"));
}

TEST_F(CommitTest, TheDeviceIsWhatWasProposed) {
  ASSERT_EQ(commit().kind, Kind::Done);
  EXPECT_EQ(device.contents(), (std::map<std::string, std::string>{
                                   {FakeDevice::pathOf(DevicePlace::Settings), "new Settings"},
                                   {FakeDevice::pathOf(DevicePlace::CopyAside), "old Settings"},
                                   {FakeDevice::pathOf(DevicePlace::InformationDirectory) +
                                        "/AccountMigrationInformation-1.txt",
                                    "new InformationDirectory"}}));
  EXPECT_THAT(device.keptNames(), IsEmpty());
}

TEST_F(CommitTest, WithoutLegacyStoresTwoFilesAreWrittenAndOneDirectoryFlushed) {
  for (const DevicePlace place :
       {DevicePlace::LegacyExchange, DevicePlace::LegacyMail, DevicePlace::LegacyExchangeOriginal,
        DevicePlace::LegacyMailOriginal, DevicePlace::AutoFetchEnabled,
        DevicePlace::InformationDirectory, DevicePlace::CommitRecord}) {
    withdraw(place);
  }
  ASSERT_EQ(commit().kind, Kind::Done);
  EXPECT_THAT(device.journal, ElementsAre("stage Settings", "put Settings", "flush Settings",
                                          "stage CopyAside", "put CopyAside"));
}

TEST_F(CommitTest, AnInformationDirectoryWithoutAFileIsMadeAlone) {
  withdraw(DevicePlace::InformationDirectory);
  propose(DevicePlace::InformationDirectory, Action::MakeDirectory);

  EXPECT_THAT(commit().warnings, IsEmpty());

  EXPECT_THAT(device.journal, testing::Contains("makeInformationDirectory"));
  EXPECT_THAT(device.journal, testing::Not(testing::Contains(HasSubstr("writeInformationFile"))));
}

TEST_F(CommitTest, AnInformationDirectoryThatCannotBeMadeIsAWarning) {
  withdraw(DevicePlace::InformationDirectory);
  propose(DevicePlace::InformationDirectory, Action::MakeDirectory);
  device.failWhenLineBegins("makeInformationDirectory");

  const CommitOutcome outcome = commit();

  EXPECT_EQ(outcome.kind, Kind::Done);
  EXPECT_THAT(outcome.warnings,
              testing::Contains(HasSubstr("directory was not made: Cannot make")));
}

TEST_F(CommitTest, NothingProposedIsNothingDone) {
  proposal = {};
  const auto before = device.contents();
  EXPECT_EQ(commit().kind, Kind::Done);
  EXPECT_EQ(device.contents(), before);
  EXPECT_THAT(device.journal, IsEmpty());
}

TEST_F(CommitTest, TheSettingsFileBelongsToWhomItIsToAndNobodyElseReadsIt) {
  proposal.changes.at(0).owner = FileOwner{501, 502};
  ASSERT_EQ(commit().kind, Kind::Done);
  const auto& settings = *device.entries.at(FakeDevice::pathOf(DevicePlace::Settings));
  EXPECT_EQ(settings.owner, (FileOwner{501, 502}));
  EXPECT_EQ(settings.identity.mode, 0600u);
}

TEST_F(CommitTest, TheCopyAsideHasThePermissionsOfTheSettingsFile) {
  DeviceSnapshot snapshot = snapshotOf(device);
  snapshot.places[indexOf(DevicePlace::Settings)].permissions = 0644;
  ASSERT_EQ(commit(device, snapshot).kind, Kind::Done);
  EXPECT_EQ(device.entries.at(FakeDevice::pathOf(DevicePlace::CopyAside))->identity.mode, 0644u);
}

TEST_F(CommitTest, ACopyAsideThatIsOnlyRemovedIsRemoved) {
  withdraw(DevicePlace::CopyAside);
  propose(DevicePlace::CopyAside, Action::Remove);
  ASSERT_EQ(commit().kind, Kind::Done);
  EXPECT_FALSE(device.exists(DevicePlace::CopyAside));
}

TEST_F(CommitTest, TheSentinelSaysWhatTheMigrationsOwnDoes) {
  std::string sentinel;
  device.before = [&](const std::string& line) {
    sentinel = line == "remove LegacyExchange" ? device.at(DevicePlace::RemovalSentinel) : sentinel;
  };
  ASSERT_EQ(commit().kind, Kind::Done);
  EXPECT_EQ(sentinel, kRemovalSentinelContents);
}

TEST_F(CommitTest, ASentinelOfAnInterruptedRemovalIsUsedAndRemoved) {
  device.write(DevicePlace::RemovalSentinel, "of an interrupted removal");
  propose(DevicePlace::RemovalSentinel, Action::Remove);
  ASSERT_EQ(commit().kind, Kind::Done);
  EXPECT_FALSE(device.exists(DevicePlace::RemovalSentinel));
  EXPECT_EQ(std::count(device.journal.begin(), device.journal.end(), "stage RemovalSentinel"), 0);
}

TEST_F(CommitTest, ARecordOfAnEarlierRunEndsWithThisOne) {
  device.write(DevicePlace::CommitRecord, "of an earlier run");
  ASSERT_EQ(commit().kind, Kind::Done);
  EXPECT_FALSE(device.exists(DevicePlace::CommitRecord));
}

TEST_F(CommitTest, ARecordThatOnlyEndsIsRemovedOnceTheEndOfTheStoresIsOnTheMedium) {
  device.write(DevicePlace::CommitRecord, "of an earlier run");
  proposal = {};
  propose(DevicePlace::CommitRecord, Action::Remove);
  device.write(kAccountMigrationDirectory, "", EntryKind::Directory);
  ASSERT_EQ(commit().kind, Kind::Done);
  EXPECT_THAT(
      device.journal,
      ElementsAre("synchronizeDirectory /var/mobile/Library", "synchronizeDirectory /var/mobile",
                  "synchronizeDirectory /var", "flush CommitRecord", "flush LegacyExchange",
                  "flush LegacyMail", "remove CommitRecord"));
}

TEST_F(CommitTest, ARecordThatIsToStayStays) {
  proposal.recordStays = true;
  ASSERT_EQ(commit().kind, Kind::Done);
  EXPECT_EQ(device.at(DevicePlace::CommitRecord), "new CommitRecord");
}

TEST_F(CommitTest, FilesThatAreToBeKeptAreKeptBeforeAnythingIsChanged) {
  proposal.keepsFiles = true;
  const CommitOutcome outcome = commit();

  EXPECT_EQ(outcome.kind, Kind::Done);
  EXPECT_EQ(outcome.keptFolder, std::string(kAccountMigrationDirectory) + "/Kept-20260102T030405Z");
  for (const char* name : {"Settings", "LegacyExchange", "LegacyMail", "LegacyExchangeOriginal",
                           "LegacyMailOriginal", "CopyAside", "AutoFetchEnabled"}) {
    EXPECT_EQ(device.at(kept(name)), std::string("old ") + name);
  }
  const auto position = [&](std::string_view beginning) {
    return std::ranges::find_if(device.journal,
                                [&](const auto& line) { return line.starts_with(beginning); }) -
           device.journal.begin();
  };
  EXPECT_LT(position("renameDirectory"), position("put CommitRecord"));
}

TEST_F(CommitTest, NeitherSentinelNorRecordIsKept) {
  proposal.keepsFiles = true;
  device.write(DevicePlace::RemovalSentinel, "of an interrupted removal");
  device.write(DevicePlace::CommitRecord, "of an earlier run");
  ASSERT_EQ(commit().kind, Kind::Done);
  EXPECT_FALSE(device.entries.contains(kept("RemovalSentinel")));
  EXPECT_FALSE(device.entries.contains(kept("CommitRecord")));
}

TEST_F(CommitTest, AFailureSaysWhatForAndWhy) {
  device.failWhenLineBegins("stage Settings", ENOSPC);
  const CommitOutcome outcome = commit();
  EXPECT_EQ(outcome.kind, Kind::Failed);
  EXPECT_EQ(outcome.error.exitStatus, ExitStatus::TemporaryFailure);
  EXPECT_EQ(outcome.error.message, "The settings file cannot be written: Cannot stage Settings");
}

TEST_F(CommitTest, AMediumThatDoesNotAnswerIsNoPassingFailure) {
  device.failWhenLineBegins("stage Settings", EIO);
  EXPECT_EQ(commit().error.exitStatus, ExitStatus::InputOutputError);
}

TEST_F(CommitTest, ASettingsFileThatCannotBePutInPlaceIsAFailureToo) {
  device.failWhenLineBegins("put Settings");
  EXPECT_EQ(commit().error.message, "The settings file cannot be replaced: Cannot put Settings");
}

TEST_F(CommitTest, FilesThatCannotBeKeptAreNotChanged) {
  proposal.keepsFiles = true;
  device.failWhenLineBegins("keep LegacyMail ", EPERM);
  const auto before = device.contents();
  const CommitOutcome outcome = commit();
  EXPECT_EQ(outcome.kind, Kind::Failed);
  EXPECT_EQ(outcome.error.exitStatus, ExitStatus::CannotCreate);
  EXPECT_THAT(outcome.error.message, HasSubstr("The files cannot be kept: "));
  EXPECT_EQ(device.contents(), before);
}

TEST_F(CommitTest, AFailureBeforeTheSettingsFileHasItsPlaceLeavesEverythingAsItWas) {
  proposal.keepsFiles = true;
  FakeDevice whole = device.copy();
  const DeviceSnapshot snapshot = snapshotOf(whole);
  ASSERT_EQ(commit(whole, snapshot).kind, Kind::Done);
  std::size_t failures = 0;
  for (std::size_t operation = 1; operation < whole.operationCount(); ++operation) {
    SCOPED_TRACE(operation);
    FakeDevice faulty = device.copy();
    const DeviceSnapshot before = snapshotOf(faulty);
    faulty.failAt(operation);
    const CommitOutcome outcome = commit(faulty, before);
    if (faulty.at(DevicePlace::Settings) == "old Settings") {
      EXPECT_EQ(outcome.kind, Kind::Failed);
      EXPECT_NE(outcome.error.message, "");
      EXPECT_EQ(faulty.contents(), device.contents());
      EXPECT_THAT(faulty.keptNames(), IsEmpty());
      ++failures;
    } else {
      EXPECT_EQ(outcome.kind, Kind::Done);
      EXPECT_TRUE(outcome.keptFolder);
    }
  }
  EXPECT_GT(failures, 20u);
}

TEST_F(CommitTest, EveryFailureAfterwardsIsAWarning) {
  const std::map<std::string, std::string> sentences = {
      {"flush Settings", "A change may not outlive a loss of power: Cannot flush Settings"},
      {"flush RemovalSentinel",
       "A change may not outlive a loss of power: Cannot flush RemovalSentinel"},
      {"remove LegacyExchange", "DataAccess.plist stays: Cannot remove LegacyExchange"},
      {"flush LegacyExchange",
       "A change may not outlive a loss of power: Cannot flush LegacyExchange"},
      {"remove LegacyMail", "Accounts.plist stays: Cannot remove LegacyMail"},
      {"remove RemovalSentinel", "The removal sentinel stays: Cannot remove RemovalSentinel"},
      {"stage CopyAside", "The settings file was not copied aside: Cannot stage CopyAside"},
      {"put CopyAside", "The settings file was not copied aside: Cannot put CopyAside"},
      {"remove AutoFetchEnabled", "AutoFetchEnabled stays: Cannot remove AutoFetchEnabled"},
      {"writeInformationFile", "The migration-information file was not written: Cannot write"},
      {"remove CommitRecord", "The commit record stays: Cannot remove CommitRecord"}};
  for (const auto& [line, sentence] : sentences) {
    FakeDevice faulty = device.copy();
    const DeviceSnapshot before = snapshotOf(faulty);
    faulty.failWhenLineBegins(line);
    const CommitOutcome outcome = commit(faulty, before);
    EXPECT_EQ(outcome.kind, Kind::Done) << line;
    EXPECT_EQ(faulty.at(DevicePlace::Settings), "new Settings") << line;
    EXPECT_THAT(outcome.warnings, testing::Contains(HasSubstr(sentence))) << line;
  }
}

TEST_F(CommitTest, WithoutASentinelTheStoresAreRemovedUnderTheRecordWhichStays) {
  device.failWhenLineBegins("stage RemovalSentinel");
  const CommitOutcome outcome = commit();
  EXPECT_EQ(outcome.kind, Kind::Done);
  EXPECT_FALSE(device.exists(DevicePlace::LegacyExchange));
  EXPECT_FALSE(device.exists(DevicePlace::LegacyMail));
  EXPECT_EQ(device.at(DevicePlace::CommitRecord), "new CommitRecord");
  EXPECT_THAT(outcome.warnings,
              testing::ElementsAre(
                  HasSubstr("The removal sentinel was not made: Cannot stage RemovalSentinel")));
}

TEST_F(CommitTest, AtAStoreThatStaysTheRemovalEndsAndTheRecordStays) {
  device.failWhenLineBegins("remove LegacyExchange", EPERM);
  const CommitOutcome outcome = commit();
  EXPECT_EQ(outcome.kind, Kind::Done);
  EXPECT_TRUE(device.exists(DevicePlace::LegacyMail));
  EXPECT_EQ(device.at(DevicePlace::CommitRecord), "new CommitRecord");
  EXPECT_FALSE(device.exists(DevicePlace::RemovalSentinel));
}

}  // namespace
}  // namespace accounts
