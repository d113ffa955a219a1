#include "tests/fakes/FakePlatform.h"
#include "tests/transaction/TransactionFixture.h"
#include "transaction/TransactionPropertyLists.h"
#include "transaction/TransactionSharedResources.h"

namespace accounts {
namespace {

const PropertyDictionary kOldList = {{"Version", 11}};
const PropertyDictionary kNewList = {{"Version", 12}};

class TransactionPropertyListsTest : public TransactionTest {
 protected:
  FakePlatform device;
  TransactionPropertyLists lists{transaction, device.propertyLists};
};

TEST_F(TransactionPropertyListsTest, AFileIsReadAsItIsInMemory) {
  snapshot.addPropertyList(DevicePlace::Settings, kOldList);
  EXPECT_EQ(lists.readDictionary(path(DevicePlace::Settings)), kOldList);
  ASSERT_TRUE(save(kNewList));
  EXPECT_EQ(lists.readDictionary(path(DevicePlace::Settings)), kNewList);
}

TEST_F(TransactionPropertyListsTest, AFileThatWasRemovedIsMissing) {
  snapshot.addPropertyList(DevicePlace::LegacyMail, kOldList);
  ASSERT_TRUE(files.removeFile(path(DevicePlace::LegacyMail)));
  EXPECT_EQ(lists.readDictionary(path(DevicePlace::LegacyMail)), std::nullopt);
}

TEST_F(TransactionPropertyListsTest, APathThatIsNotListedHoldsNothingForAMigration) {
  device.addPropertyList("/etc/other.plist", kOldList);
  EXPECT_EQ(lists.readDictionary("/etc/other.plist"), std::nullopt);
}

TEST_F(TransactionPropertyListsTest, WhatCannotBeWrittenIsRefusedWhenItIsSerialised) {
  device.propertyLists.serializationError = "too deep";
  const auto result = lists.serializeBinary(kNewList);
  ASSERT_FALSE(result);
  EXPECT_EQ(result.error().text, "too deep");
}

struct TransactionSharedResourcesTest : testing::Test {
  FakePlatform device;
};

TEST_F(TransactionSharedResourcesTest, TheMigrationsLockIsHeldByWhoeverCommits) {
  TransactionSharedResources shared(device.sharedResources, MigrationLockState::Available);
  const auto lock = shared.makeLock(kMigrationLockName);
  ASSERT_NE(lock, nullptr);
  lock->lock();
  lock->unlock();
  EXPECT_TRUE(device.journal.empty()) << "no lock of the device is touched";
}

TEST_F(TransactionSharedResourcesTest, WhereNoLockCanBeMadeThereIsNone) {
  TransactionSharedResources shared(device.sharedResources, MigrationLockState::Impossible);
  EXPECT_EQ(shared.makeLock(kMigrationLockName), nullptr);
}

TEST_F(TransactionSharedResourcesTest, NoOtherLockIsMade) {
  TransactionSharedResources shared(device.sharedResources, MigrationLockState::Available);
  EXPECT_EQ(shared.makeLock("Other"), nullptr);
}

TEST_F(TransactionSharedResourcesTest, DirectoriesAreThoseOfTheDevice) {
  TransactionSharedResources shared(device.sharedResources, MigrationLockState::Available);
  EXPECT_EQ(shared.systemRootDirectory(), device.sharedResources.systemRootDirectory());
  EXPECT_EQ(shared.sharedResourcesDirectory(), device.sharedResources.sharedResourcesDirectory());
}

}  // namespace
}  // namespace accounts
