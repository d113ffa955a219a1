#include <sys/wait.h>

#include "platform/linux/StagedName.h"
#include "tests/platform/DevicePlacesFixture.h"

namespace accounts {
namespace {

namespace fs = std::filesystem;

constexpr DevicePlace kRemovedStore = DevicePlace::LegacyMail;

class DevicePlacesRemovingTest : public DevicePlacesTest {};

TEST_F(DevicePlacesRemovingTest, TheFileThatWasFoundIsRemoved) {
  makeFile(path(kRemovedStore), "store");
  const FileIdentity found = snapshot().at(kRemovedStore).identity;
  EXPECT_EQ(wordOf(places.remove(kRemovedStore, found)), "done");
  EXPECT_TRUE(namesIn(kMail).empty());
}

TEST_F(DevicePlacesRemovingTest, ALinkIsRemovedAndNotWhatItLeadsTo) {
  makeFile("/var/elsewhere", "store");
  makeLink(path(kRemovedStore), "/var/elsewhere");
  const FileIdentity found = snapshot().at(kRemovedStore).identity;
  EXPECT_EQ(wordOf(places.remove(kRemovedStore, found)), "done");
  EXPECT_TRUE(namesIn(kMail).empty());
  EXPECT_EQ(contentsOf("/var/elsewhere"), "store");
}

TEST_F(DevicePlacesRemovingTest, AnotherProgramsFileComesBack) {
  makeFile(path(kRemovedStore), "store");
  const FileIdentity found = snapshot().at(kRemovedStore).identity;
  writeAsAnotherProgram(kRemovedStore, "of another program");

  EXPECT_EQ(wordOf(places.remove(kRemovedStore, found)), "disturbed");

  EXPECT_EQ(contentsOf(path(kRemovedStore)), "of another program");
  EXPECT_EQ(namesIn(kMail).size(), 1u);
}

TEST_F(DevicePlacesRemovingTest, AMissingFileIsADisturbance) {
  makeFile(path(kRemovedStore), "store");
  const FileIdentity found = snapshot().at(kRemovedStore).identity;
  fs::remove(hostPath(kRemovedStore));
  EXPECT_EQ(wordOf(places.remove(kRemovedStore, found)), "disturbed");
  EXPECT_TRUE(namesIn(kMail).empty());
}

TEST_F(DevicePlacesRemovingTest, ADirectoryIsNotRemoved) {
  makeDirectory(path(kRemovedStore));
  const FileIdentity found = snapshot().at(kRemovedStore).identity;
  EXPECT_EQ(wordOf(places.remove(kRemovedStore, found)),
            "Cannot remove " + path(kRemovedStore) + ": Is a directory");
  EXPECT_EQ(namesIn(kMail).size(), 1u);
}

TEST_F(DevicePlacesRemovingTest, ADirectoryThatTookTheFilesPlaceComesBack) {
  makeFile(path(kRemovedStore), "store");
  const FileIdentity found = snapshot().at(kRemovedStore).identity;
  fs::remove(hostPath(kRemovedStore));
  makeFile(path(kRemovedStore) + "/in it", "");
  EXPECT_EQ(wordOf(places.remove(kRemovedStore, found)), "disturbed");
  EXPECT_TRUE(fs::exists(hostPath(kRemovedStore) / "in it"));
}

TEST_F(DevicePlacesRemovingTest, WhatMayNotBeRemovedStaysAndSaysWhy) {
  makeFile(path(kRemovedStore), "store");
  fs::permissions(hostPath(kRemovedStore), fs::perms(0644));
  fs::permissions(onHost(kMail), fs::perms(0555));
  const WithoutPrivileges everyone;
  const PlaceState state = snapshot().at(kRemovedStore);
  EXPECT_EQ(wordOf(places.remove(kRemovedStore, state.identity)), textOf(state.whyNotRemoved));
  EXPECT_EQ(contentsOf(path(kRemovedStore)), "store");
}

TEST_F(DevicePlacesRemovingTest, NothingIsRemovedWhereThereIsNoDirectory) {
  fs::remove(onHost(kMail));
  static_cast<void>(snapshot());
  EXPECT_EQ(wordOf(places.remove(kRemovedStore, FileIdentity())),
            "Cannot open " + std::string(kMail) + ": No such file or directory");
}

TEST_F(DevicePlacesRemovingTest, WhatAnotherProgramWroteLastIsNeverRemoved) {
  constexpr int kWrites = 1000;
  makeFile(path(kRemovedStore), "0");
  const pid_t writer = ::fork();
  if (writer == 0) {
    for (int number = 1; number <= kWrites; ++number) {
      writeAsAnotherProgram(kRemovedStore, std::to_string(number));
    }
    ::_exit(0);
  }
  int disturbed = 0;
  std::string lastRemoved;
  bool isWriting = true;
  while (isWriting) {
    isWriting = ::waitpid(writer, nullptr, WNOHANG) == 0;
    const DeviceSnapshot taken = snapshot();
    const std::string text = bytesOf(taken.at(kRemovedStore));
    const PlaceOutcome outcome = places.remove(kRemovedStore, taken.at(kRemovedStore).identity);
    ASSERT_NE(outcome.kind, PlaceOutcome::Kind::Failed) << outcome.failure.text;
    lastRemoved = outcome.isDone() ? text : lastRemoved;
    disturbed += outcome.isDone() ? 0 : 1;
  }
  // The last one is there, or was removed by somebody who knew it.
  const bool isThere = fs::exists(hostPath(kRemovedStore));
  EXPECT_EQ(isThere ? contentsOf(path(kRemovedStore)) : lastRemoved, std::to_string(kWrites));
  EXPECT_EQ(namesIn(kMail).size(), isThere ? 1u : 0u);
  RecordProperty("disturbed", disturbed);
}

}  // namespace
}  // namespace accounts
