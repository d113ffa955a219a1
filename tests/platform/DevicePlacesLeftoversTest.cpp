#include <sys/syscall.h>

#include <cstdlib>

#include "platform/linux/EntryIdentity.h"
#include "platform/linux/StagedName.h"
#include "platform/linux/TemporaryFile.h"
#include "tests/platform/DevicePlacesFixture.h"

namespace accounts {
namespace {

namespace fs = std::filesystem;

constexpr DevicePlace kSettings = DevicePlace::Settings;
constexpr DevicePlace kLeftStore = DevicePlace::LegacyMail;

/// A device on which a run was killed.
class DevicePlacesLeftoversTest : public DevicePlacesTest {
 protected:
  /// A file beside a place under the name that a commit gives it.
  fs::path leave(std::string_view text, const StagedName& staged) const {
    const fs::path own = hostPath(staged.place).parent_path() / "own";
    makeHostFile(own, text);
    return rename(own, staged);
  }
  static fs::path rename(const fs::path& own, const StagedName& staged) {
    const fs::path name = own.parent_path() / staged.text().value();
    fs::rename(own, name);
    return name;
  }
  static std::uint64_t markOfFile(const fs::path& path) {
    struct stat status = {};
    EXPECT_EQ(::lstat(path.c_str(), &status), 0) << path;
    return markOf(identityOf(status));
  }
  void expectSettledQuietly() { EXPECT_EQ(places.settleLeftovers(), std::vector<std::string>()); }

  /// The mark of a file that is none of a test's.
  static constexpr std::uint64_t kOther = 1;
};

TEST_F(DevicePlacesLeftoversTest, AFileThatWasStagedAndNotPutGoes) {
  makeFile(path(kSettings), "old");
  const fs::path own = onHost(kPreferences) / "own";
  makeHostFile(own, "new");
  rename(own, {kSettings, markOfFile(own), markOfFile(hostPath(kSettings))});

  expectSettledQuietly();

  EXPECT_EQ(contentsOf(path(kSettings)), "old");
  EXPECT_EQ(namesIn(kPreferences).size(), 1u);
}

TEST_F(DevicePlacesLeftoversTest, AFileThatWasReplacedGoes) {
  makeFile(path(kSettings), "new");
  const fs::path own = onHost(kPreferences) / "own";
  makeHostFile(own, "old");
  rename(own, {kSettings, markOfFile(hostPath(kSettings)), markOfFile(own)});

  expectSettledQuietly();

  EXPECT_EQ(contentsOf(path(kSettings)), "new");
  EXPECT_EQ(namesIn(kPreferences).size(), 1u);
}

TEST_F(DevicePlacesLeftoversTest, AFileThatWasMovedAwayToBeRemovedGoes) {
  const fs::path own = onHost(kMail) / "own";
  makeHostFile(own, "store");
  rename(own, {kLeftStore, 0, markOfFile(own)});
  expectSettledQuietly();
  EXPECT_TRUE(namesIn(kMail).empty());
}

TEST_F(DevicePlacesLeftoversTest, AnotherProgramsFileThatWasMovedAwayComesBack) {
  leave("of another program", {kLeftStore, 0, kOther});
  expectSettledQuietly();
  EXPECT_EQ(contentsOf(path(kLeftStore)), "of another program");
  EXPECT_EQ(namesIn(kMail).size(), 1u);
}

TEST_F(DevicePlacesLeftoversTest, AnotherProgramsFileThatWasExchangedComesBack) {
  makeFile(path(kSettings), "new");
  leave("of another program", {kSettings, markOfFile(hostPath(kSettings)), kOther});
  expectSettledQuietly();
  EXPECT_EQ(contentsOf(path(kSettings)), "of another program");
  EXPECT_EQ(namesIn(kPreferences).size(), 1u);
}

TEST_F(DevicePlacesLeftoversTest, BesideAFileThatIsNewerAnotherProgramsFileStaysAndIsTold) {
  makeFile(path(kSettings), "newer");
  const fs::path own = leave("of another program", {kSettings, kOther, kOther});

  EXPECT_EQ(places.settleLeftovers(),
            std::vector<std::string>{"Cannot settle what an interrupted run left at " +
                                     std::string(kPreferences) + "/" + own.filename().string() +
                                     ": File exists"});

  EXPECT_EQ(contentsOf(path(kSettings)), "newer");
  EXPECT_EQ(hostFileContents(own), "of another program");
}

TEST_F(DevicePlacesLeftoversTest, AFileThatAnotherProgramWroteInPlaceComesBack) {
  makeHostFile(onHost(kMail) / "own", "store");
  const std::uint64_t store = markOfFile(onHost(kMail) / "own");
  makeHostFile(rename(onHost(kMail) / "own", {kLeftStore, 0, store}), "store, and more");
  makeFile(path(kSettings), "new");
  makeHostFile(onHost(kPreferences) / "own", "old");
  const std::uint64_t old = markOfFile(onHost(kPreferences) / "own");
  makeHostFile(
      rename(onHost(kPreferences) / "own", {kSettings, markOfFile(hostPath(kSettings)), old}),
      "old, and more");

  expectSettledQuietly();

  EXPECT_EQ(contentsOf(path(kLeftStore)), "store, and more");
  EXPECT_EQ(contentsOf(path(kSettings)), "old, and more");
  EXPECT_EQ(namesIn(kMail).size(), 1u);
  EXPECT_EQ(namesIn(kPreferences).size(), 1u);
}

TEST_F(DevicePlacesLeftoversTest, AFileThatWasToGetItsPlaceBackGetsIt) {
  makeFile(path(kSettings), "new");
  const fs::path own = onHost(kPreferences) / "own";
  makeHostFile(own, "of another program");
  rename(
      own,
      {.place = kSettings, .made = markOfFile(hostPath(kSettings)), .returned = markOfFile(own)});
  expectSettledQuietly();
  EXPECT_EQ(contentsOf(path(kSettings)), "of another program");
  EXPECT_EQ(namesIn(kPreferences).size(), 1u);
}

TEST_F(DevicePlacesLeftoversTest, AFileThatCameOutForOneThatGotItsPlaceBackIsTheNewerOne) {
  makeFile(path(kSettings), "of another program");
  leave("newer", {.place = kSettings, .made = kOther, .returned = markOfFile(hostPath(kSettings))});
  expectSettledQuietly();
  EXPECT_EQ(contentsOf(path(kSettings)), "newer");
  EXPECT_EQ(namesIn(kPreferences).size(), 1u);
}

TEST_F(DevicePlacesLeftoversTest, AnAbandonedTemporaryFileGoes) {
  makeFile(std::string(kCrashReporter) + "/" + std::string(kTemporaryFilePrefix) + "0123", "half");
  expectSettledQuietly();
  EXPECT_TRUE(namesIn(kCrashReporter).empty());
}

TEST_F(DevicePlacesLeftoversTest, AnAbandonedInformationFileGoes) {
  const std::string directory = path(DevicePlace::InformationDirectory);
  makeFile(directory + "/" + std::string(kTemporaryFilePrefix) + "0123", "half");
  makeFile(directory + "/AccountMigrationInformation-1.txt", "whole");
  expectSettledQuietly();
  EXPECT_EQ(namesIn(directory), std::vector<std::string>{"AccountMigrationInformation-1.txt"});
}

TEST_F(DevicePlacesLeftoversTest, ATemporaryFileThatIsInUseStays) {
  const auto staged = stage(kSettings, "new");
  expectSettledQuietly();
  EXPECT_EQ(namesIn(kPreferences).size(), 1u);
}

TEST_F(DevicePlacesLeftoversTest, AllThatIsLeftIsDealtWith) {
  leave("settings", {kSettings, 0, kOther});
  leave("store", {DevicePlace::LegacyExchange, 0, kOther});
  leave("record", {DevicePlace::CommitRecord, 0, kOther});
  leave("copy", {DevicePlace::CopyAside, 0, kOther});
  expectSettledQuietly();
  EXPECT_EQ(contentsOf(path(kSettings)), "settings");
  EXPECT_EQ(contentsOf(path(DevicePlace::LegacyExchange)), "store");
  EXPECT_EQ(contentsOf(path(DevicePlace::CommitRecord)), "record");
  EXPECT_EQ(contentsOf(path(DevicePlace::CopyAside)), "copy");
}

TEST_F(DevicePlacesLeftoversTest, OtherFilesStay) {
  const std::string foreignName =
      StagedName{.place = kLeftStore, .made = 0, .replaced = kOther}.text().value();
  makeFile(std::string(kPreferences) + "/" + foreignName, "in another directory than its place's");
  makeFile(std::string(kMail) + "/" + foreignName.substr(1), "a similar name");
  makeFile(path(kSettings), "settings");
  expectSettledQuietly();
  EXPECT_EQ(namesIn(kPreferences).size(), 2u);
  EXPECT_EQ(namesIn(kMail).size(), 1u);
}

TEST_F(DevicePlacesLeftoversTest, MissingDirectoriesHaveNoLeftovers) {
  fs::remove_all(onHost("/var"));
  expectSettledQuietly();
  EXPECT_TRUE(namesIn("/").empty());
}

TEST_F(DevicePlacesLeftoversTest, WhatMayNotBeRemovedIsTold) {
  const fs::path own = onHost(kMail) / "own";
  makeHostFile(own, "store");
  rename(own, {kLeftStore, 0, markOfFile(own)});
  fs::permissions(onHost(kMail), fs::perms(0555));
  const WithoutPrivileges everyone;
  const std::vector<std::string> sentences = places.settleLeftovers();
  ASSERT_EQ(sentences.size(), 1u);
  EXPECT_NE(sentences[0].find("Permission denied"), std::string::npos);
}

/// Where the file system knows no renaming but the plain one: these tests end their process.
class DevicePlacesWithoutExchangeDeathTest : public DevicePlacesLeftoversTest {
 protected:
  [[noreturn]] static void exitWith(const std::string& word) {
    std::fputs(word.c_str(), stderr);
    std::_Exit(0);
  }
};

TEST_F(DevicePlacesWithoutExchangeDeathTest, AFileIsReplacedByAPlainRename) {
  makeFile(path(kSettings), "old");
  const auto put = [&] {
    makeSystemCallFail(SYS_renameat2, EINVAL);
    const FileIdentity found = snapshot().at(kSettings).identity;
    exitWith(wordOf(places.put(kSettings, *stage(kSettings, "new"), found)));
  };
  EXPECT_EXIT(put(), testing::ExitedWithCode(0), "done");
  EXPECT_EQ(contentsOf(path(kSettings)), "new");
  EXPECT_EQ(namesIn(kPreferences).size(), 1u);
}

TEST_F(DevicePlacesWithoutExchangeDeathTest, AnEmptyPlaceIsTaken) {
  const auto put = [&] {
    makeSystemCallFail(SYS_renameat2, ENOSYS);
    static_cast<void>(snapshot());
    exitWith(wordOf(places.put(kSettings, *stage(kSettings, "new"), FileIdentity())));
  };
  EXPECT_EXIT(put(), testing::ExitedWithCode(0), "done");
  EXPECT_EQ(contentsOf(path(kSettings)), "new");
  EXPECT_EQ(namesIn(kPreferences).size(), 1u);
}

TEST_F(DevicePlacesWithoutExchangeDeathTest, WhatAnotherProgramWroteBeforeStays) {
  makeFile(path(kSettings), "old");
  const auto put = [&] {
    makeSystemCallFail(SYS_renameat2, EOPNOTSUPP);
    const FileIdentity found = snapshot().at(kSettings).identity;
    auto staged = stage(kSettings, "new");
    writeAsAnotherProgram(kSettings, "of another program");
    const std::string word = wordOf(places.put(kSettings, *staged, found));
    staged.reset();
    exitWith(word);
  };
  EXPECT_EXIT(put(), testing::ExitedWithCode(0), "disturbed");
  EXPECT_EQ(contentsOf(path(kSettings)), "of another program");
  EXPECT_EQ(namesIn(kPreferences).size(), 1u);
}

TEST_F(DevicePlacesWithoutExchangeDeathTest, SomebodyElsesLinkInPlaceOfAStagedFileGetsNoPlace) {
  makeFile(path(kSettings), "old");
  makeFile("/var/foreign", "of somebody else");
  const auto put = [&] {
    makeSystemCallFail(SYS_renameat2, EINVAL);
    const FileIdentity found = snapshot().at(kSettings).identity;
    auto staged = stage(kSettings, "new");
    for (const std::string& name : namesIn(kPreferences)) {
      if (name.starts_with(kTemporaryFilePrefix)) {
        fs::remove(onHost(kPreferences) / name);
        fs::create_hard_link(onHost("/var/foreign"), onHost(kPreferences) / name);
      }
    }
    const std::string word = wordOf(places.put(kSettings, *staged, found));
    staged.reset();
    exitWith(word);
  };
  EXPECT_EXIT(put(), testing::ExitedWithCode(0), "disturbed");
  EXPECT_EQ(contentsOf(path(kSettings)), "old");
  EXPECT_EQ(namesIn(kPreferences).size(), 1u);
  EXPECT_EQ(contentsOf("/var/foreign"), "of somebody else");
}

TEST_F(DevicePlacesWithoutExchangeDeathTest, AFileIsRemovedAndAnotherProgramsComesBack) {
  makeFile(path(kSettings), "old");
  makeFile(path(kLeftStore), "store");
  const auto remove = [&] {
    makeSystemCallFail(SYS_renameat2, EINVAL);
    const DeviceSnapshot taken = snapshot();
    writeAsAnotherProgram(kLeftStore, "of another program");
    const std::string first = wordOf(places.remove(kSettings, taken.at(kSettings).identity));
    exitWith(first + " " + wordOf(places.remove(kLeftStore, taken.at(kLeftStore).identity)));
  };
  EXPECT_EXIT(remove(), testing::ExitedWithCode(0), "done disturbed");
  EXPECT_TRUE(namesIn(kPreferences).empty());
  EXPECT_EQ(contentsOf(path(kLeftStore)), "of another program");
}

TEST_F(DevicePlacesWithoutExchangeDeathTest, WhatAKilledRunMovedAwayComesBack) {
  leave("of another program", {kLeftStore, 0, kOther});
  const auto settle = [&] {
    makeSystemCallFail(SYS_renameat2, EINVAL);
    std::string told;
    for (const std::string& each : places.settleLeftovers()) {
      told += each;
    }
    exitWith(told + "settled");
  };
  EXPECT_EXIT(settle(), testing::ExitedWithCode(0), "^settled");
  EXPECT_EQ(contentsOf(path(kLeftStore)), "of another program");
  EXPECT_EQ(namesIn(kMail).size(), 1u);
}

}  // namespace
}  // namespace accounts
