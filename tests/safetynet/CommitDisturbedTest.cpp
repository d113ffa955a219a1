#include "tests/safetynet/CommitFixture.h"

namespace accounts {
namespace {

using testing::Contains;
using testing::HasSubstr;
using testing::IsEmpty;
using Kind = CommitOutcome::Kind;

using CommitDisturbedTest = CommitTest;

TEST_F(CommitDisturbedTest, AFileThatIsWrittenBeforeTheCommitLeavesEverythingAsItIsNow) {
  for (const ListedPlace& each : kDevicePlaces) {
    if (each.place == DevicePlace::InformationDirectory) {
      continue;
    }
    SCOPED_TRACE(each.name);
    FakeDevice disturbed = device.copy();
    const DeviceSnapshot before = snapshotOf(disturbed);
    disturbed.write(each.place, "of another program");
    const auto now = disturbed.contents();

    const CommitOutcome outcome = commit(disturbed, before);

    EXPECT_EQ(outcome.kind, Kind::Disturbed);
    EXPECT_FALSE(outcome.keptFolder);
    EXPECT_EQ(disturbed.contents(), now);
  }
}

TEST_F(CommitDisturbedTest, AFileThatIsRemovedBeforeTheCommitDisturbsItToo) {
  const DeviceSnapshot before = snapshotOf(device);
  device.erase(DevicePlace::LegacyMail);
  EXPECT_EQ(commit(device, before).kind, Kind::Disturbed);
  EXPECT_EQ(device.at(DevicePlace::Settings), "old Settings");
}

TEST_F(CommitDisturbedTest, AChangeOfOwnerOrModeAloneDisturbsIt) {
  const DeviceSnapshot before = snapshotOf(device);
  device.entries.at(FakeDevice::pathOf(DevicePlace::LegacyMail))->identity.changed.seconds += 1;
  EXPECT_EQ(commit(device, before).kind, Kind::Disturbed);
}

TEST_F(CommitDisturbedTest, FilesInTheInformationDirectoryDisturbNobody) {
  device.write(FakeDevice::pathOf(DevicePlace::InformationDirectory), "", EntryKind::Directory);
  const DeviceSnapshot before = snapshotOf(device);
  device.entries.at(FakeDevice::pathOf(DevicePlace::InformationDirectory))
      ->identity.modified.seconds += 1;
  EXPECT_EQ(commit(device, before).kind, Kind::Done);
}

TEST_F(CommitDisturbedTest, WhatWasKeptForTheAttemptGoes) {
  proposal.keepsFiles = true;
  const DeviceSnapshot before = snapshotOf(device);
  device.before = [&](const std::string& line) {
    if (line == "put Settings") {
      device.write(DevicePlace::Settings, "of another program");
    }
  };
  const CommitOutcome outcome = commit(device, before);
  EXPECT_EQ(outcome.kind, Kind::Disturbed);
  EXPECT_THAT(device.keptNames(), IsEmpty());
  EXPECT_FALSE(device.exists(DevicePlace::CommitRecord));
  EXPECT_EQ(device.at(DevicePlace::Settings), "of another program");
}

TEST_F(CommitDisturbedTest, AStoreThatIsWrittenMeanwhileStaysWithAWarningAndTheRecord) {
  const DeviceSnapshot before = snapshotOf(device);
  device.before = [&](const std::string& line) {
    if (line == "remove LegacyMail") {
      device.write(DevicePlace::LegacyMail, "of another program");
    }
  };
  const CommitOutcome outcome = commit(device, before);
  EXPECT_EQ(outcome.kind, Kind::Done);
  EXPECT_EQ(device.at(DevicePlace::LegacyMail), "of another program");
  EXPECT_THAT(outcome.warnings,
              Contains(HasSubstr("Accounts.plist stays: Another program wrote it meanwhile")));
  EXPECT_TRUE(device.exists(DevicePlace::CommitRecord));
}

TEST_F(CommitDisturbedTest, ASettingsFileThatStoodForAMomentLeavesTheRecordForTheNextAttempt) {
  const DeviceSnapshot before = snapshotOf(device);
  device.overtakesPut = DevicePlace::Settings;
  EXPECT_EQ(commit(device, before).kind, Kind::Disturbed);
  EXPECT_TRUE(device.exists(DevicePlace::CommitRecord));
}

/// Lets another program write a place before each operation of a commit.
class AnotherWriterTest : public CommitTest, public testing::WithParamInterface<DevicePlace> {};

TEST_P(AnotherWriterTest, IsNeverOverwrittenUnseen) {
  const DevicePlace place = GetParam();
  proposal.keepsFiles = true;
  FakeDevice whole = device.copy();
  ASSERT_EQ(commit(whole, snapshotOf(whole)).kind, Kind::Done);
  for (std::size_t number = 1; number < whole.operationCount(); ++number) {
    SCOPED_TRACE(number);
    FakeDevice disturbed = device.copy();
    const DeviceSnapshot before = snapshotOf(disturbed);
    std::size_t operation = 1;
    std::string line;
    disturbed.before = [&](const std::string& next) {
      if (operation++ == number) {
        line = next;
        disturbed.write(place, "of another program");
      }
    };
    const CommitOutcome outcome = commit(disturbed, before);
    SCOPED_TRACE(line);
    EXPECT_NE(outcome.kind, Kind::Failed);
    EXPECT_EQ(disturbed.at(place), "of another program");
    if (outcome.kind == Kind::Disturbed) {
      EXPECT_EQ(disturbed.exists(DevicePlace::LegacyExchange), true);
      EXPECT_THAT(disturbed.keptNames(), IsEmpty());
    }
  }
}

INSTANTIATE_TEST_SUITE_P(Places, AnotherWriterTest,
                         testing::Values(DevicePlace::Settings, DevicePlace::LegacyExchange,
                                         DevicePlace::LegacyMail, DevicePlace::CopyAside,
                                         DevicePlace::AutoFetchEnabled,
                                         DevicePlace::LegacyMailOriginal),
                         [](const testing::TestParamInfo<DevicePlace>& place) {
                           return std::string(listed(place.param).name);
                         });

}  // namespace
}  // namespace accounts
