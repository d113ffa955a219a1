#include <sys/syscall.h>

#include <cstdlib>

#include "tests/platform/DevicePlacesFixture.h"

namespace accounts {
namespace {

namespace fs = std::filesystem;

constexpr DevicePlace kStore = DevicePlace::LegacyMail;
constexpr const char* kKept = "/var/mobile/Library/AccountMigration/Kept/LegacyMail";

class DevicePlacesKeepingTest : public DevicePlacesTest {
 protected:
  DevicePlacesKeepingTest() { makeDirectory("/var/mobile/Library/AccountMigration/Kept"); }

  void expectCopyOf(const char* copyPath, const struct stat& original) const {
    const struct stat copy = statusOf(copyPath);
    EXPECT_NE(copy.st_ino, original.st_ino);
    EXPECT_EQ(copy.st_mode, original.st_mode);
    EXPECT_EQ(copy.st_uid, original.st_uid);
    EXPECT_EQ(copy.st_gid, original.st_gid);
    EXPECT_EQ(copy.st_mtim.tv_sec, original.st_mtim.tv_sec);
    EXPECT_EQ(copy.st_mtim.tv_nsec, original.st_mtim.tv_nsec);
  }
  /// Ends the process with 0 if an outcome is done.
  [[noreturn]] static void exitWith(const PlaceOutcome& outcome) {
    std::fputs(wordOf(outcome).c_str(), stderr);
    std::_Exit(outcome.isDone() ? 0 : 1);
  }
};

TEST_F(DevicePlacesKeepingTest, AKeptFileIsTheSameUnderASecondName) {
  makeFile(path(kStore), "store");
  const FileIdentity found = snapshot().at(kStore).identity;
  EXPECT_EQ(wordOf(places.keep(kStore, kKept, found)), "done");
  EXPECT_EQ(statusOf(kKept).st_ino, statusOf(path(kStore)).st_ino);
}

TEST_F(DevicePlacesKeepingTest, ALinkIsKeptAsOne) {
  makeLink(path(kStore), "/nowhere");
  const FileIdentity found = snapshot().at(kStore).identity;
  EXPECT_EQ(wordOf(places.keep(kStore, kKept, found)), "done");
  EXPECT_EQ(fs::read_symlink(onHost(kKept)), "/nowhere");
}

TEST_F(DevicePlacesKeepingTest, AnotherProgramsFileIsNotKept) {
  makeFile(path(kStore), "store");
  const FileIdentity found = snapshot().at(kStore).identity;
  writeAsAnotherProgram(kStore, "of another program");
  EXPECT_EQ(wordOf(places.keep(kStore, kKept, found)), "disturbed");
  EXPECT_FALSE(fs::exists(onHost(kKept)));
}

TEST_F(DevicePlacesKeepingTest, AFileThatIsGoneIsNotKept) {
  makeFile(path(kStore), "store");
  const FileIdentity found = snapshot().at(kStore).identity;
  fs::remove(hostPath(kStore));
  EXPECT_EQ(wordOf(places.keep(kStore, kKept, found)), "disturbed");
}

TEST_F(DevicePlacesKeepingTest, WhatExistsAlreadyIsNotOverwritten) {
  makeFile(path(kStore), "store");
  makeFile(kKept, "older");
  const FileIdentity found = snapshot().at(kStore).identity;
  EXPECT_EQ(wordOf(places.keep(kStore, kKept, found)),
            "Cannot create " + std::string(kKept) + ": File exists");
  EXPECT_EQ(contentsOf(kKept), "older");
}

TEST_F(DevicePlacesKeepingTest, AKeptFileComesBackWithItsContentsAndIsStillKept) {
  makeFile(kKept, "store");
  makeFile(path(kStore), "newer");
  const FileIdentity found = snapshot().at(kStore).identity;
  auto staged = places.stageKept(kStore, kKept);
  ASSERT_TRUE(staged);

  EXPECT_EQ(wordOf(places.put(kStore, **staged, found)), "done");

  EXPECT_EQ(contentsOf(path(kStore)), "store");
  EXPECT_EQ(contentsOf(kKept), "store");
  EXPECT_EQ(namesIn(kMail).size(), 1u);
}

TEST_F(DevicePlacesKeepingTest, AKeptLinkComesBackAsOne) {
  makeLink(kKept, "/nowhere");
  auto staged = places.stageKept(kStore, kKept);
  ASSERT_TRUE(staged);
  EXPECT_EQ(wordOf(places.put(kStore, **staged, FileIdentity())), "done");
  EXPECT_EQ(fs::read_symlink(hostPath(kStore)), "/nowhere");
}

TEST_F(DevicePlacesKeepingTest, AKeptFileThatGetsNoPlaceIsKeptAlone) {
  makeFile(kKept, "store");
  static_cast<void>(places.stageKept(kStore, kKept));
  EXPECT_TRUE(namesIn(kMail).empty());
  EXPECT_EQ(contentsOf(kKept), "store");
}

TEST_F(DevicePlacesKeepingTest, AMissingKeptFileIsAFailure) {
  const auto staged = places.stageKept(kStore, kKept);
  ASSERT_FALSE(staged);
  EXPECT_EQ(staged.error().number, ENOENT);
}

/// Where a file can have no second name: these tests end their process, in which link() fails.
using DevicePlacesWithoutLinksDeathTest = DevicePlacesKeepingTest;

TEST_F(DevicePlacesWithoutLinksDeathTest, ACopyIsKept) {
  makeFile(path(kStore), "store");
  fs::permissions(hostPath(kStore), fs::perms(0640));
  fs::last_write_time(hostPath(kStore), fs::file_time_type::clock::now() - std::chrono::hours(48));
  for (const int number : {EXDEV, EPERM, EMLINK, EOPNOTSUPP}) {
    const FileIdentity found = snapshot().at(kStore).identity;
    const auto keep = [&] {
      makeSystemCallFail(SYS_linkat, number);
      const WithMask mask(0777);
      exitWith(places.keep(kStore, kKept, found));
    };
    EXPECT_EXIT(keep(), testing::ExitedWithCode(0), "done") << number;
    EXPECT_EQ(contentsOf(kKept), "store");
    expectCopyOf(kKept, statusOf(path(kStore)));
    fs::remove(onHost(kKept));
  }
}

TEST_F(DevicePlacesWithoutLinksDeathTest, ACopyComesBackAsAnother) {
  makeFile(kKept, "store");
  fs::permissions(onHost(kKept), fs::perms(0640));
  const auto putBack = [&] {
    makeSystemCallFail(SYS_linkat, EPERM);
    auto staged = places.stageKept(kStore, kKept);
    exitWith(places.put(kStore, **staged, FileIdentity()));
  };
  EXPECT_EXIT(putBack(), testing::ExitedWithCode(0), "done");
  EXPECT_EQ(contentsOf(path(kStore)), "store");
  EXPECT_EQ(contentsOf(kKept), "store");
  expectCopyOf(path(kStore).c_str(), statusOf(kKept));
}

TEST_F(DevicePlacesWithoutLinksDeathTest, WhatCannotBeCopiedEitherIsAFailure) {
  makeLink(path(kStore), "/nowhere");
  const FileIdentity found = snapshot().at(kStore).identity;
  const auto keep = [&] {
    makeSystemCallFail(SYS_linkat, EPERM);
    exitWith(places.keep(kStore, kKept, found));
  };
  EXPECT_EXIT(keep(), testing::ExitedWithCode(1), "It is a symbolic link, not a regular file");
  EXPECT_TRUE(namesIn("/var/mobile/Library/AccountMigration/Kept").empty());
}

}  // namespace
}  // namespace accounts
