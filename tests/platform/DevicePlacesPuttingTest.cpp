#include <sys/wait.h>

#include "tests/platform/DevicePlacesFixture.h"

namespace accounts {
namespace {

namespace fs = std::filesystem;

constexpr DevicePlace kReplacedSettings = DevicePlace::Settings;

class DevicePlacesPuttingTest : public DevicePlacesTest {
 protected:
  /// The only name beside the places that begins as that of a temporary file.
  [[nodiscard]] fs::path temporaryFile() const {
    for (const std::string& name : namesIn(kPreferences)) {
      if (name.starts_with(kTemporaryFilePrefix)) {
        return onHost(kPreferences) / name;
      }
    }
    ADD_FAILURE() << "no temporary file";
    return {};
  }
  [[nodiscard]] std::vector<std::string> onlySettings() const {
    return {hostPath(kReplacedSettings).filename().string()};
  }
};

TEST_F(DevicePlacesPuttingTest, AStagedFileTakesThePlaceOfTheOneThatWasFound) {
  makeFile(path(kReplacedSettings), "old");
  const FileIdentity found = snapshot().at(kReplacedSettings).identity;
  const auto staged = stage(kReplacedSettings, "new");
  EXPECT_EQ(contentsOf(path(kReplacedSettings)), "old");

  EXPECT_EQ(wordOf(places.put(kReplacedSettings, *staged, found)), "done");

  EXPECT_EQ(contentsOf(path(kReplacedSettings)), "new");
  EXPECT_EQ(namesIn(kPreferences), onlySettings());
}

TEST_F(DevicePlacesPuttingTest, AStagedFileTakesAnEmptyPlace) {
  static_cast<void>(snapshot());
  const auto staged = stage(kReplacedSettings, "new");
  EXPECT_EQ(wordOf(places.put(kReplacedSettings, *staged, FileIdentity())), "done");
  EXPECT_EQ(contentsOf(path(kReplacedSettings)), "new");
  EXPECT_EQ(namesIn(kPreferences), onlySettings());
}

TEST_F(DevicePlacesPuttingTest, ADirectoryIsNotReplaced) {
  makeDirectory(path(kReplacedSettings));
  const FileIdentity found = snapshot().at(kReplacedSettings).identity;
  const auto staged = stage(kReplacedSettings, "new");
  EXPECT_EQ(wordOf(places.put(kReplacedSettings, *staged, found)),
            "Cannot replace " + path(kReplacedSettings) + ": Is a directory");
  EXPECT_TRUE(snapshot().at(kReplacedSettings).identity.isSameFileAs(found));
}

TEST_F(DevicePlacesPuttingTest, AStagedFileThatGetsNoPlaceIsRemoved) {
  static_cast<void>(stage(kReplacedSettings, "new"));
  EXPECT_TRUE(namesIn(kPreferences).empty());
}

TEST_F(DevicePlacesPuttingTest, AStagedFileReplacesALinkAndNotWhatItLeadsTo) {
  makeFile("/var/elsewhere", "elsewhere");
  makeLink(path(kReplacedSettings), "/var/elsewhere");
  const FileIdentity found = snapshot().at(kReplacedSettings).identity;
  const auto staged = stage(kReplacedSettings, "new");
  EXPECT_EQ(wordOf(places.put(kReplacedSettings, *staged, found)), "done");
  EXPECT_EQ(contentsOf(path(kReplacedSettings)), "new");
  EXPECT_EQ(contentsOf("/var/elsewhere"), "elsewhere");
}

TEST_F(DevicePlacesPuttingTest, AFileHasItsPermissionsWhateverTheMask) {
  const WithMask mask(0777);
  const auto staged = stage(kReplacedSettings, "new", 0644);
  EXPECT_EQ(wordOf(places.put(kReplacedSettings, *staged, FileIdentity())), "done");
  EXPECT_EQ(permissionsOf(path(kReplacedSettings)), 0644u);
}

TEST_F(DevicePlacesPuttingTest, AFileBelongsToWhomItIsGiven) {
  if (::geteuid() != 0) {
    GTEST_SKIP() << "Only the superuser gives files away.";
  }
  const auto staged = stage(kReplacedSettings, "new", 0600, FileOwner{501, 502});
  EXPECT_EQ(wordOf(places.put(kReplacedSettings, *staged, FileIdentity())), "done");
  EXPECT_EQ(statusOf(path(kReplacedSettings)).st_uid, 501u);
  EXPECT_EQ(statusOf(path(kReplacedSettings)).st_gid, 502u);
}

TEST_F(DevicePlacesPuttingTest, AFileThatCannotBeGivenAwayIsAFailureAndLeavesNothing) {
  fs::permissions(onHost(kPreferences), fs::perms(0777));
  const WithoutPrivileges everyone;
  const FakeBytes contents("new");
  const auto staged =
      places.stage(kReplacedSettings, {.contents = &contents, .owner = FileOwner{12345, 12345}});
  ASSERT_FALSE(staged);
  EXPECT_EQ(staged.error().text,
            "Cannot set the owner of " + path(kReplacedSettings) + ": Operation not permitted");
  EXPECT_TRUE(namesIn(kPreferences).empty());
}

TEST_F(DevicePlacesPuttingTest, BytesThatCannotBeReadAreAFailureAndLeaveNothing) {
  const FakeBytes contents("half of it", Failure{EIO, "Cannot read it"});
  const auto staged = places.stage(kReplacedSettings, {.contents = &contents});
  ASSERT_FALSE(staged);
  EXPECT_EQ(staged.error().text, "Cannot read it");
  EXPECT_TRUE(namesIn(kPreferences).empty());
}

TEST_F(DevicePlacesPuttingTest, AFullDiskIsAFailureAndLeavesNothing) {
  const WithLargestWrittenFile limit(4);
  const FakeBytes contents("more than four");
  const auto staged = places.stage(kReplacedSettings, {.contents = &contents});
  ASSERT_FALSE(staged);
  EXPECT_EQ(staged.error().number, EFBIG);
  EXPECT_TRUE(namesIn(kPreferences).empty());
}

TEST_F(DevicePlacesPuttingTest, AMissingDirectoryIsAFailure) {
  fs::remove(onHost(kMail));
  static_cast<void>(snapshot());
  const FakeBytes contents("new");
  EXPECT_FALSE(places.stage(DevicePlace::LegacyMail, {.contents = &contents}));
}

TEST_F(DevicePlacesPuttingTest, ADirectoryThatIsMadeAfterTheSnapshotIsUsed) {
  fs::remove(onHost(kMail));
  static_cast<void>(snapshot());
  makeDirectory(kMail);
  const auto staged = stage(DevicePlace::LegacyMail, "new");
  EXPECT_EQ(wordOf(places.put(DevicePlace::LegacyMail, *staged, FileIdentity())), "done");
}

TEST_F(DevicePlacesPuttingTest, ADirectoryIsThatOfTheSnapshotWhateverItsPathLeadsToNow) {
  makeFile(path(kReplacedSettings), "old");
  const FileIdentity found = snapshot().at(kReplacedSettings).identity;
  fs::rename(onHost(kPreferences), onHost("/var/moved"));
  makeDirectory(kPreferences);
  const auto staged = stage(kReplacedSettings, "new");
  EXPECT_EQ(wordOf(places.put(kReplacedSettings, *staged, found)), "done");
  fs::remove(onHost(kPreferences));
  EXPECT_EQ(textOf(places.flush(kReplacedSettings)), "(none)");
  EXPECT_EQ(hostFileContents(onHost("/var/moved") / onlySettings()[0]), "new");
}

TEST_F(DevicePlacesPuttingTest, WhatAnotherProgramWroteBeforeStaysAndIsTold) {
  makeFile(path(kReplacedSettings), "old");
  const FileIdentity found = snapshot().at(kReplacedSettings).identity;
  auto staged = stage(kReplacedSettings, "new");
  writeAsAnotherProgram(kReplacedSettings, "of another program");

  EXPECT_EQ(wordOf(places.put(kReplacedSettings, *staged, found)), "disturbed");

  staged.reset();
  EXPECT_EQ(contentsOf(path(kReplacedSettings)), "of another program");
  EXPECT_EQ(namesIn(kPreferences), onlySettings());
}

TEST_F(DevicePlacesPuttingTest, AFileThatWasWrittenInPlaceIsAnotherOne) {
  makeFile(path(kReplacedSettings), "old");
  const FileIdentity found = snapshot().at(kReplacedSettings).identity;
  const auto staged = stage(kReplacedSettings, "new");
  makeFile(path(kReplacedSettings), "old, and more");
  EXPECT_EQ(wordOf(places.put(kReplacedSettings, *staged, found)), "disturbed");
  EXPECT_EQ(contentsOf(path(kReplacedSettings)), "old, and more");
}

TEST_F(DevicePlacesPuttingTest, AFileThatGotASecondNameIsStillTheSame) {
  makeFile(path(kReplacedSettings), "old");
  const FileIdentity found = snapshot().at(kReplacedSettings).identity;
  const auto staged = stage(kReplacedSettings, "new");
  fs::create_hard_link(hostPath(kReplacedSettings), onHost("/kept"));
  EXPECT_EQ(wordOf(places.put(kReplacedSettings, *staged, found)), "done");
  EXPECT_EQ(contentsOf("/kept"), "old");
}

TEST_F(DevicePlacesPuttingTest, WhatAnotherProgramPutIntoAnEmptyPlaceStays) {
  static_cast<void>(snapshot());
  auto staged = stage(kReplacedSettings, "new");
  writeAsAnotherProgram(kReplacedSettings, "of another program");
  EXPECT_EQ(wordOf(places.put(kReplacedSettings, *staged, FileIdentity())), "disturbed");
  staged.reset();
  EXPECT_EQ(contentsOf(path(kReplacedSettings)), "of another program");
  EXPECT_EQ(namesIn(kPreferences), onlySettings());
}

TEST_F(DevicePlacesPuttingTest, APlaceThatAnotherProgramEmptiedStaysEmpty) {
  makeFile(path(kReplacedSettings), "old");
  const FileIdentity found = snapshot().at(kReplacedSettings).identity;
  auto staged = stage(kReplacedSettings, "new");
  fs::remove(hostPath(kReplacedSettings));
  EXPECT_EQ(wordOf(places.put(kReplacedSettings, *staged, found)), "disturbed");
  staged.reset();
  EXPECT_TRUE(namesIn(kPreferences).empty());
}

/// Another process puts a second name of a file of its own where the temporary file was.
class ForeignLinkTest : public DevicePlacesPuttingTest {
 protected:
  ForeignLinkTest() {
    makeFile("/var/foreign", "of somebody else");
    fs::permissions(onHost("/var/foreign"), fs::perms(0604));
    before_ = statusOf("/var/foreign");
  }
  void linkInPlaceOf(const fs::path& temporary) const {
    fs::remove(temporary);
    fs::create_hard_link(onHost("/var/foreign"), temporary);
  }
  void expectForeignFileUntouched() const {
    const struct stat now = statusOf("/var/foreign");
    EXPECT_EQ(contentsOf("/var/foreign"), "of somebody else");
    EXPECT_EQ(now.st_mode, before_.st_mode);
    EXPECT_EQ(now.st_uid, before_.st_uid);
    EXPECT_EQ(now.st_gid, before_.st_gid);
  }

 private:
  struct stat before_ = {};
};

TEST_F(ForeignLinkTest, InPlaceOfAStagedFileGetsNoPlaceThatAFileHad) {
  makeFile(path(kReplacedSettings), "old");
  const FileIdentity found = snapshot().at(kReplacedSettings).identity;
  const auto staged = stage(kReplacedSettings, "new", 0666, FileOwner{::geteuid(), ::getegid()});
  linkInPlaceOf(temporaryFile());

  EXPECT_EQ(wordOf(places.put(kReplacedSettings, *staged, found)), "disturbed");

  EXPECT_EQ(contentsOf(path(kReplacedSettings)), "old");
  EXPECT_EQ(namesIn(kPreferences), onlySettings());
  expectForeignFileUntouched();
}

TEST_F(ForeignLinkTest, InPlaceOfAStagedFileIsToldWhereNothingWas) {
  static_cast<void>(snapshot());
  const auto staged = stage(kReplacedSettings, "new");
  linkInPlaceOf(temporaryFile());
  EXPECT_EQ(wordOf(places.put(kReplacedSettings, *staged, FileIdentity())), "disturbed");
  expectForeignFileUntouched();
}

TEST_F(ForeignLinkTest, PutThereInALoopNeverChangesTheForeignFile) {
  makeFile(path(kReplacedSettings), "old");
  const pid_t attacker = ::fork();
  if (attacker == 0) {
    for (;;) {
      std::error_code ignored;
      for (const auto& entry : fs::directory_iterator(onHost(kPreferences), ignored)) {
        if (entry.path().filename().string().starts_with(kTemporaryFilePrefix)) {
          ::unlink(entry.path().c_str());
          ::link(onHost("/var/foreign").c_str(), entry.path().c_str());
        }
      }
    }
  }
  constexpr int kRounds = 100;
  for (int round = 0; round < kRounds; ++round) {
    const DeviceSnapshot taken = snapshot();
    const std::string text = "new " + std::to_string(round);
    const FakeBytes contents(text);
    auto staged = places.stage(
        kReplacedSettings,
        {.contents = &contents, .permissions = 0666, .owner = FileOwner{::geteuid(), ::getegid()}});
    if (staged &&
        places.put(kReplacedSettings, **staged, taken.at(kReplacedSettings).identity).isDone()) {
      EXPECT_EQ(contentsOf(path(kReplacedSettings)), text);
    }
  }
  ::kill(attacker, SIGKILL);
  ::waitpid(attacker, nullptr, 0);
  expectForeignFileUntouched();
}

TEST_F(DevicePlacesPuttingTest, NothingThatAnotherProgramWritesAllTheTimeIsLost) {
  constexpr int kWrites = 1000;
  makeFile(path(kReplacedSettings), "0");
  const pid_t writer = ::fork();
  if (writer == 0) {
    for (int number = 1; number <= kWrites; ++number) {
      writeAsAnotherProgram(kReplacedSettings, std::to_string(number));
    }
    ::_exit(0);
  }
  int done = 0;
  int disturbed = 0;
  bool isWriting = true;
  while (isWriting) {
    isWriting = ::waitpid(writer, nullptr, WNOHANG) == 0;
    const DeviceSnapshot taken = snapshot();
    // What was there goes on living in what takes its place.
    auto staged = stage(kReplacedSettings, bytesOf(taken.at(kReplacedSettings)));
    const PlaceOutcome outcome =
        places.put(kReplacedSettings, *staged, taken.at(kReplacedSettings).identity);
    ASSERT_NE(outcome.kind, PlaceOutcome::Kind::Failed) << outcome.failure.text;
    (outcome.isDone() ? done : disturbed) += 1;
  }
  EXPECT_EQ(contentsOf(path(kReplacedSettings)), std::to_string(kWrites));
  EXPECT_EQ(namesIn(kPreferences), onlySettings());
  EXPECT_GT(done, 0);
  RecordProperty("disturbed", disturbed);
}

}  // namespace
}  // namespace accounts
