#include "safetynet/SaveObserver.h"

#include <gtest/gtest.h>

#include "accountsettings/AccountsManager.h"
#include "accountsettings/Process.h"
#include "tests/fakes/FakePlatform.h"
#include "tests/fakes/PlainContents.h"

namespace accounts {
namespace {

/// The plug-in's own store on a device in memory, its saves observed.
class SaveObserverTest : public testing::Test {
 protected:
  SaveObserverTest() { AccountsManager::_setShouldSkipNotifications(true); }

  void save() { AccountsManager::initInsideOfMigration()->saveAllAccounts(); }

  FakePlatform device;
  SaveObserver observer{device.fileSystem, std::string(kSettingsPath)};
  Platform observed{device.bundleResources,     device.cloudAccountService,
                    device.cloudTabService,     device.consoleLog,
                    device.dateFormatter,       device.deviceInfoService,
                    device.externalSyncSources, observer,
                    device.frameworkLoader,     device.homeDirectory,
                    device.localizedStrings,    device.logSystem,
                    device.mailDirectory,       device.pairingValueStore,
                    device.preferenceDomain,    device.preferencesBroadcast,
                    device.profileRestrictions, device.propertyLists,
                    device.sharedResources,     device.uuidGenerator};
  Process process{observed};
};

TEST_F(SaveObserverTest, WithoutASaveThereIsNone) {
  static_cast<void>(AccountsManager::initInsideOfMigration());

  EXPECT_EQ(observer.saves().last, LastSave::None);
  EXPECT_FALSE(observer.saves().replacedFile);
}

TEST_F(SaveObserverTest, ASaveIsWritten) {
  save();

  EXPECT_EQ(observer.saves().last, LastSave::Written);
  EXPECT_TRUE(observer.saves().replacedFile);
}

TEST_F(SaveObserverTest, ASaveFailsWhereverItStops) {
  for (const char* step : {"makeTemporary", "write ", "setOwner ", "rename "}) {
    SCOPED_TRACE(step);
    device.fileSystem.failWhenLineBegins(step);

    save();

    EXPECT_EQ(observer.saves().last, LastSave::Failed);
    device.fileSystem.removeFaults();
  }
}

TEST_F(SaveObserverTest, ASaveThatCannotBeSerializedFailed) {
  device.propertyLists.serializationError = "too deep";

  save();

  EXPECT_EQ(observer.saves().last, LastSave::Failed);
  EXPECT_FALSE(observer.saves().replacedFile);
}

TEST_F(SaveObserverTest, TheLastSaveCounts) {
  save();
  device.fileSystem.failWhenLineBegins("write ");
  save();

  EXPECT_EQ(observer.saves().last, LastSave::Failed);
  EXPECT_TRUE(observer.saves().replacedFile);
}

TEST_F(SaveObserverTest, OtherFilesAreNoSaves) {
  device.fileSystem.addFile("/tmp/one", "contents");

  EXPECT_TRUE(observer.renameFile("/tmp/one", "/tmp/other"));
  EXPECT_TRUE(observer.writeFileAtomically(kSentinelPath, plainContents("contents")));

  EXPECT_EQ(observer.saves().last, LastSave::None);
}

}  // namespace
}  // namespace accounts
