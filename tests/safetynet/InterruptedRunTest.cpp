#include "tests/safetynet/RunFixture.h"

namespace accounts {
namespace {

using testing::ElementsAre;
using testing::IsEmpty;

/// Runs that are killed, and the ones after them.
class InterruptedRunTest : public RunTest {
 protected:
  /// Runs until an operation of the device, if it comes to it; whether it was killed there.
  static bool runUntil(FakeDevice& on, std::size_t operation,
                       RunPurpose purpose = RunPurpose::Migration) {
    FakeHostLocks free;
    RunMeans its = meansOf(on, free);
    FakeDevice before = on.copy();
    on.stopBefore(on.operationCount() + operation);
    try {
      static_cast<void>(MigrationRun(its).run(purpose, KeepFiles::WhenNeeded));
    } catch (const WorldStopped&) {
      on.removeFaults();
      return true;
    }
    on.removeFaults();
    return false;
  }
  static void expectMigratedOnce(FakeDevice& on) {
    FakeHostLocks free;
    RunMeans its = meansOf(on, free);
    EXPECT_EQ(MigrationRun(its).run(RunPurpose::Migration, KeepFiles::WhenNeeded).exitStatus,
              ExitStatus::Success);
    EXPECT_THAT(accountsOn(on), ElementsAre("one", "mail"));
    EXPECT_FALSE(on.exists(DevicePlace::LegacyMail));
    EXPECT_FALSE(on.exists(DevicePlace::RemovalSentinel));
    EXPECT_FALSE(on.exists(DevicePlace::CommitRecord));
  }
};

TEST_F(InterruptedRunTest, KilledAnywhereTheDeviceIsAsItWasOrMigrated) {
  bool isKilled = true;
  for (std::size_t operation = 0; isKilled; ++operation) {
    SCOPED_TRACE(operation);
    FakeDevice killed = device.copy();
    isKilled = runUntil(killed, operation);
    if (accountsOn(killed).size() == 1) {
      EXPECT_TRUE(killed.exists(DevicePlace::LegacyMail));
    } else {
      EXPECT_THAT(accountsOn(killed), ElementsAre("one", "mail"));
    }
  }
}

TEST_F(InterruptedRunTest, KilledAnywhereNoStoreIsConvertedTwice) {
  bool isKilled = true;
  for (std::size_t operation = 0; isKilled; ++operation) {
    SCOPED_TRACE(operation);
    FakeDevice killed = device.copy();
    isKilled = runUntil(killed, operation);
    expectMigratedOnce(killed);
  }
}

TEST_F(InterruptedRunTest, KilledTwiceInARowNoStoreIsConvertedTwice) {
  bool isKilled = true;
  std::size_t pairs = 0;
  for (std::size_t first = 0; isKilled; ++first) {
    FakeDevice once = device.copy();
    isKilled = runUntil(once, first);
    bool isKilledAgain = true;
    for (std::size_t second = 0; isKilledAgain; ++second, ++pairs) {
      SCOPED_TRACE(testing::Message() << first << " and " << second);
      FakeDevice twice = once.copy();
      isKilledAgain = runUntil(twice, second);
      expectMigratedOnce(twice);
    }
  }
  EXPECT_GT(pairs, 1000u);
}

TEST_F(InterruptedRunTest, WhatIsInterruptedIsFinishedWithoutThePlugin) {
  bool isKilled = true;
  for (std::size_t operation = 0; isKilled; ++operation) {
    SCOPED_TRACE(operation);
    FakeDevice killed = device.copy();
    isKilled = runUntil(killed, operation);
    const bool isMigrated = accountsOn(killed).size() == 2;
    EXPECT_FALSE(runUntil(killed, 100'000, RunPurpose::FinishingAlone));
    EXPECT_EQ(killed.exists(DevicePlace::LegacyMail), !isMigrated);
    EXPECT_FALSE(killed.exists(DevicePlace::CommitRecord));
    EXPECT_FALSE(killed.exists(DevicePlace::RemovalSentinel));
    EXPECT_EQ(accountsOn(killed).size(), isMigrated ? 2u : 1u);
  }
}

TEST_F(InterruptedRunTest, AStoreThatComesBackFromABackupIsNotConvertedAgain) {
  const auto store = device.entries.at(FakeDevice::pathOf(DevicePlace::LegacyMail));
  bool isKilled = true;
  for (std::size_t operation = 0; isKilled; ++operation) {
    SCOPED_TRACE(operation);
    FakeDevice killed = device.copy();
    isKilled = runUntil(killed, operation);
    if (isKilled && killed.exists(DevicePlace::CommitRecord)) {
      auto copy = std::make_shared<FakeDevice::Entry>(*store);
      copy->identity.inode = 1;
      killed.entries[FakeDevice::pathOf(DevicePlace::LegacyMail)] = copy;
    }
    expectMigratedOnce(killed);
  }
}

TEST_F(InterruptedRunTest, ASettingsFileThatComesBackFromABackupIsMigratedAnew) {
  const auto settings = device.entries.at(FakeDevice::pathOf(DevicePlace::Settings));
  bool isKilled = true;
  for (std::size_t operation = 0; isKilled; ++operation) {
    SCOPED_TRACE(operation);
    FakeDevice killed = device.copy();
    isKilled = runUntil(killed, operation);
    if (isKilled && killed.exists(DevicePlace::LegacyMail)) {
      killed.entries[FakeDevice::pathOf(DevicePlace::Settings)] = settings;
      expectMigratedOnce(killed);
    }
  }
}

TEST_F(InterruptedRunTest, ASettingsFileThatAnotherProgramRewroteStillHasTheStore) {
  bool isKilled = true;
  for (std::size_t operation = 0; isKilled; ++operation) {
    SCOPED_TRACE(operation);
    FakeDevice killed = device.copy();
    isKilled = runUntil(killed, operation);
    // The same accounts in another file.
    killed.write(DevicePlace::Settings, killed.at(DevicePlace::Settings));
    expectMigratedOnce(killed);
  }
}

TEST_F(InterruptedRunTest, AStoreThatCannotBeRemovedIsConvertedOnceHoweverOftenItIsTried) {
  device.unremovable[DevicePlace::LegacyMail] = {EPERM, "Cannot remove it"};
  for (int number = 0; number < 3; ++number) {
    EXPECT_EQ(run().exitStatus, ExitStatus::Success);
    EXPECT_THAT(accountsOn(device), ElementsAre("one", "mail"));
    EXPECT_TRUE(device.exists(DevicePlace::LegacyMail));
    EXPECT_TRUE(device.exists(DevicePlace::CommitRecord));
  }
  device.unremovable.clear();
  expectMigratedOnce(device);
}

}  // namespace
}  // namespace accounts
