#include "report/RecordedMigration.h"

#include <gtest/gtest.h>

#include "report/MigrationRecorder.h"
#include "report/RecordedPlatform.h"
#include "tests/fakes/FakePlatform.h"
#include "tests/fakes/PlainContents.h"

namespace accounts {
namespace {

PropertyDictionary settings(std::int64_t version, std::string_view name) {
  return {{"Version", version},
          {"Accounts", PropertyArray{PropertyDictionary{
                           {"Identifier", "A"}, {"DisplayName", name}, {"Password", "secret"}}}}};
}

/// A recording of what a test lets happen.
class Recording : public testing::Test {
 protected:
  [[nodiscard]] RecordedMigration recorded() const { return RecordedMigration::fromLines(lines); }

  std::vector<std::string> lines;
  MigrationRecorder recorder{[this](std::string_view line) { lines.emplace_back(line); },
                             Secrets::Hide};
};

TEST_F(Recording, OfNothingIsEmpty) {
  EXPECT_TRUE(recorded().stages.empty());
  EXPECT_TRUE(recorded().versions["before"].is_null());
}

TEST_F(Recording, AStageHasWhatHappenedInIt) {
  recorder.stageBegan("first:", "Do it");
  recorder.recordFile("removed", "/a", std::nullopt);
  recorder.recordLogLine(LogKind::Console, "line");
  recorder.stageEnded(true, std::nullopt);

  const JSON stage = recorded().stages.at(0);
  EXPECT_EQ(stage["name"], "first:");
  EXPECT_EQ(stage["title"], "Do it");
  EXPECT_EQ(stage["succeeded"], true);
  EXPECT_GE(stage["seconds"], 0.0);
  EXPECT_EQ(stage["files"], (JSON{{{"action", "removed"}, {"path", "/a"}}}));
  EXPECT_EQ(stage["log"], (JSON{{{"to", "console"}, {"text", "line"}}}));
}

TEST_F(Recording, AStagesAccountsAreThoseThatTheMigrationSaysAndNotThoseOfEqualIdentifiers) {
  const auto account = [](std::string_view identifier, std::string_view name) {
    return PropertyDictionary{{"Identifier", identifier}, {"DisplayName", name}};
  };
  const auto settingsOf = [](const PropertyArray& accounts) {
    return PropertyDictionary{{"Version", 1}, {"Accounts", accounts}};
  };
  using Kind = AccountOrigin::Kind;
  recorder.recordBefore(
      {{FileKind::AccountSettings, settingsOf({account("A", "first"), account("B", "second")})}});
  recorder.stageBegan("first:", "First");

  recorder.stageEnded(true,
                      AccountsInMemory{settingsOf({account("A", "second"), account("C", "made")}),
                                       {{Kind::Settings, 1}, {Kind::Made, 1}}});

  const JSON changes = recorded().stages.at(0)["accounts"];
  ASSERT_EQ(changes.size(), 3U);
  EXPECT_EQ(changes[0]["change"], "changed");
  EXPECT_EQ(changes[0]["account"], "Accounts[1]");
  EXPECT_EQ(changes[0]["properties"],
            (JSON{{{"path", "Identifier"}, {"before", "B"}, {"after", "A"}}}));
  EXPECT_EQ(changes[1]["change"], "added");
  EXPECT_EQ(changes[1]["identifier"], "C");
  EXPECT_FALSE(changes[1].contains("account"));
  EXPECT_EQ(changes[2]["change"], "removed");
  EXPECT_EQ(changes[2]["title"], "'first'");
  EXPECT_EQ(changes[2]["account"], "Accounts[0]");
}

TEST_F(Recording, ALongLogLineIsCutBetweenCharactersAndSaysSo) {
  const std::string kept((std::size_t{16} << 10) - 1, 'x');
  recorder.recordLogLine(LogKind::Console, kept + "x");
  recorder.recordLogLine(LogKind::Channel, kept + "\u00e9!");

  const JSON log = recorded().stages.at(0)["log"];
  EXPECT_EQ(log[0]["text"], kept + "x");
  EXPECT_EQ(log[1]["text"], kept + "… (3 bytes more)");
}

TEST_F(Recording, AStageIsComparedWithTheOneBeforeIt) {
  recorder.recordBefore({{FileKind::AccountSettings, settings(1, "one")}});
  recorder.stageBegan("first:", "First");
  recorder.stageEnded(true, AccountsInMemory{settings(1, "two"), {}});
  recorder.stageBegan("second:", "Second");
  recorder.stageEnded(true, AccountsInMemory{settings(2, "two"), {}});

  const JSON stages = recorded().stages;
  EXPECT_EQ(stages.at(0)["accounts"][0]["properties"],
            (JSON{{{"path", "DisplayName"}, {"before", "one"}, {"after", "two"}}}));
  EXPECT_TRUE(stages.at(0)["otherProperties"].empty());
  EXPECT_TRUE(stages.at(1)["accounts"].empty());
  EXPECT_EQ(stages.at(1)["otherProperties"],
            (JSON{{{"path", "Version"}, {"before", 1}, {"after", 2}}}));
}

TEST_F(Recording, AStageThatDidNotEndHasNoResult) {
  recorder.stageBegan("first:", "First");

  EXPECT_FALSE(recorded().stages.at(0).contains("succeeded"));
}

TEST_F(Recording, WhatHappensBetweenStagesIsInOneWithoutAName) {
  recorder.recordLogLine(LogKind::Channel, "one");
  recorder.recordLogLine(LogKind::Channel, "two");
  recorder.stageBegan("first:", "First");
  recorder.stageEnded(true, std::nullopt);
  recorder.recordLogLine(LogKind::Channel, "three");

  const JSON stages = recorded().stages;
  ASSERT_EQ(stages.size(), 3U);
  EXPECT_TRUE(stages.at(0)["name"].is_null());
  EXPECT_EQ(stages.at(0)["log"].size(), 2U);
  EXPECT_EQ(stages.at(2)["log"][0]["text"], "three");
}

TEST_F(Recording, TheAccountsBeforeAndAfterAreTrees) {
  PropertyDictionary parent = {{"Identifier", "P"}};
  parent.set("ChildAccounts", PropertyArray{PropertyDictionary{{"Identifier", "C"}}});
  const PropertyDictionary family = {{"Accounts", PropertyArray{parent}}};

  recorder.recordBefore({});
  recorder.recordAfter(family);

  EXPECT_TRUE(recorded().accountsBefore.empty());
  const JSON after = recorded().accountsAfter;
  ASSERT_EQ(after.size(), 1U);
  EXPECT_EQ(after[0]["identifier"], "P");
  EXPECT_EQ(after[0]["children"][0]["identifier"], "C");
  EXPECT_EQ(after[0]["children"][0]["place"], "1.1");
}

TEST_F(Recording, SecretsAreHidden) {
  recorder.recordBefore({{FileKind::AccountSettings, settings(1, "one")}});
  recorder.stageBegan("first:", "First");
  recorder.stageEnded(true, AccountsInMemory{{{"Accounts", PropertyArray{}}}, {}});
  recorder.recordAfter(settings(2, "two"));

  for (const std::string& line : lines) {
    EXPECT_EQ(line.find("secret"), std::string::npos) << line;
  }
}

TEST_F(Recording, LinesThatAreCutOffCountForNothing) {
  recorder.stageBegan("first:", "First");
  lines.emplace_back("{\"ended\": {\"succ");

  EXPECT_EQ(recorded().stages.size(), 1U);
}

/// A device whose platform is recorded.
class RecordedDevice : public Recording {
 protected:
  RecordedDevice() { device.fileSystem.addFile("/var/a", "a"); }

  [[nodiscard]] JSON filesOf(const std::function<void(FileSystem& files)>& work) {
    recorder.stageBegan("work", "Work");
    work(recordedPlatform.platform().fileSystem);
    recorder.stageEnded(true, std::nullopt);
    return recorded().stages.back()["files"];
  }

  FakePlatform device;
  RecordedPlatform recordedPlatform{device.platform, recorder};
};

TEST_F(RecordedDevice, ASaveIsOneFileThatIsWritten) {
  const JSON files = filesOf([](FileSystem& fileSystem) {
    const std::optional<std::string> temporary = fileSystem.makeTemporaryFile();
    ASSERT_TRUE(temporary);
    EXPECT_TRUE(fileSystem.writeFile(*temporary, plainContents("new")));
    EXPECT_TRUE(fileSystem.setOwnerAndGroup(*temporary, "mobile", "mobile"));
    EXPECT_TRUE(fileSystem.renameFile(*temporary, "/var/a"));
  });

  EXPECT_EQ(files.back(), (JSON{{"action", "written"}, {"path", "/var/a"}}));
}

TEST_F(RecordedDevice, AFailureIsRecordedWithItsReason) {
  device.fileSystem.failWhenLineBegins("remove ");

  const JSON files =
      filesOf([](FileSystem& fileSystem) { EXPECT_FALSE(fileSystem.removeFile("/var/a")); });

  ASSERT_EQ(files.size(), 1U);
  EXPECT_EQ(files[0]["action"], "removed");
  EXPECT_TRUE(files[0].contains("error"));
}

TEST_F(RecordedDevice, AFailureWithATemporaryFileDoesNotSayItsName) {
  const JSON files = filesOf([](FileSystem& fileSystem) {
    const std::optional<std::string> temporary = fileSystem.makeTemporaryFile();
    ASSERT_TRUE(temporary);
    EXPECT_FALSE(fileSystem.setOwnerAndGroup(*temporary, "nobody", "nobody"));
  });

  ASSERT_EQ(files.size(), 1U);
  EXPECT_EQ(files[0]["action"], "given away");
  EXPECT_EQ(files[0]["path"], "temporary file");
  EXPECT_TRUE(files[0].contains("error"));
}

TEST_F(RecordedDevice, ThatNothingWasThereToRemoveIsNoNews) {
  EXPECT_TRUE(filesOf([](FileSystem& fileSystem) {
                EXPECT_FALSE(fileSystem.removeFile("/var/none"));
              }).empty());
}

TEST_F(RecordedDevice, LogLinesAreWrittenAndRecorded) {
  recordedPlatform.platform().consoleLog.writeLine("a line");

  EXPECT_EQ(recorded().stages.back()["log"][0]["text"], "a line");
  EXPECT_FALSE(device.journal.empty());
}

}  // namespace
}  // namespace accounts
