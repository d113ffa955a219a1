#include <gmock/gmock.h>

#include <filesystem>
#include <iostream>
#include <memory>
#include <tuple>

#include "tests/program/ExitStatuses.h"
#include "tests/program/InterruptedDevice.h"
#include "tests/program/SmallDisk.h"

// A device whose home directory is a file system of its own that is really full: of blocks or of
// files, to every degree from nothing free to enough.

namespace accounts {
namespace {

constexpr const char* kHome = "/var/mobile";
constexpr const char* kSaveFailed = "\"Failed to save accounts to filesystem.\"";

/// What the disk runs out of.
struct Shortage {
  const char* name;
  void (SmallDisk::*leave)(std::uint64_t count) const;
};

std::ostream& operator<<(std::ostream& stream, const Shortage& shortage) {
  return stream << shortage.name;
}

constexpr Shortage kShortages[] = {
    {"Blocks", &SmallDisk::leaveBlocks},
    {"Inodes", &SmallDisk::leaveInodes},
};

// More than a migration of these devices takes of anything.
constexpr std::uint64_t kEnough = 24;

class FullDisk : public InterruptedDevice,
                 public testing::WithParamInterface<std::tuple<SmallDisk::Kind, Shortage>> {
 protected:
  void SetUp() override {
    disk_ = std::make_unique<SmallDisk>(std::get<0>(GetParam()), onThisMachine(kHome));
    if (disk_->reason()) {
      GTEST_SKIP() << *disk_->reason();
    }
    makeDevice();
  }

  void TearDown() override { disk_.reset(); }

  void leave(std::uint64_t count) const { ((*disk_).*std::get<1>(GetParam()).leave)(count); }

  /// Makes the device anew on a disk with room.
  void makeDeviceAgain() const {
    disk_->makeRoom();
    makeDevice();
  }

  /// Expects that no file of a migration's own is left, whether it succeeded or not.
  void expectNoLeftovers() const {
    EXPECT_FALSE(exists(kSentinelPath));
    for (const char* directory : {"/var/mobile/tmp", "/var/mobile/Library/Preferences"}) {
      for (const std::string& file : files()) {
        EXPECT_FALSE(file.starts_with(std::string(directory) + "/.")) << file;
      }
    }
  }

  std::unique_ptr<SmallDisk> disk_;
};

TEST_P(FullDisk, ToAnyDegreeLeavesTheSettingsWhollyOldOrWhollyNew) {
  int failures = 0;
  for (std::uint64_t free = 0; free <= kEnough; ++free) {
    SCOPED_TRACE("free: " + std::to_string(free));
    leave(free);

    const ProgramResult result = migrate({"--bare", "--channel", "-"});

    // The plug-in's own result: it is that of the upgrade, whatever becomes of the save.
    EXPECT_EQ(result.exitStatus, 0);
    const PropertyDictionary settings = readDictionary(kSettingsPath);
    const bool isNew = settings == settingsAfter();
    EXPECT_TRUE(isNew || settings == settingsBefore());
    if (!isNew) {
      ++failures;
      EXPECT_THAT(result.errors, testing::HasSubstr(kSaveFailed));
    }
    expectNoLeftovers();
    expectLockIsFree();
    makeDeviceAgain();
  }

  EXPECT_GT(failures, 0);
  std::cout << kEnough + 1 << " degrees of fullness, " << failures << " too full\n";
}

TEST_P(FullDisk, ToAnyDegreeLosesNothingWithTheSafetyNet) {
  for (std::uint64_t free = 0; free <= kEnough; ++free) {
    SCOPED_TRACE("free: " + std::to_string(free));
    leave(free);

    const ProgramResult result = migrate();

    EXPECT_THAT(result.exitStatus,
                testing::AnyOf(0, kVerificationFailed, kMayPass, kInputOutputError));
    expectNothingLost();
    expectNoLeftovers();
    disk_->makeRoom();
    expectNextRunFinishes({});
    makeDevice();
  }
}

TEST_P(FullDisk, WithEnoughRoomIsMigrated) {
  leave(kEnough);

  EXPECT_EQ(migrate({"--bare"}).exitStatus, 0);

  disk_->makeRoom();
  expectMigrated();
}

std::string nameOfDisk(
    const testing::TestParamInfo<std::tuple<SmallDisk::Kind, Shortage>>& information) {
  const auto& [kind, shortage] = information.param;
  return testing::PrintToString(kind) + shortage.name;
}

INSTANTIATE_TEST_SUITE_P(Kinds, FullDisk,
                         testing::Combine(testing::Values(SmallDisk::Kind::Memory,
                                                          SmallDisk::Kind::Ext4),
                                          testing::ValuesIn(kShortages)),
                         nameOfDisk);

}  // namespace
}  // namespace accounts
