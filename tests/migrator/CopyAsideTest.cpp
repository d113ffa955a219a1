#include "tests/migrator/MigratorFixture.h"

namespace accounts {
namespace {

using CopyAsideTest = MigratorTest;

TEST_F(CopyAsideTest, TheSettingsFileIsCopiedByteForByte) {
  device.fileSystem.addFile(kSettingsPath, "no property list at all");

  migrator._copyAsideAccountsPlist();

  EXPECT_EQ(device.fileSystem.contentsOf(copyAside), "no property list at all");
  EXPECT_TRUE(console().empty());
}

TEST_F(CopyAsideTest, AnEarlierCopyIsReplaced) {
  device.fileSystem.addFile(kSettingsPath, "new");
  device.fileSystem.addFile(copyAside, "old");

  migrator._copyAsideAccountsPlist();

  EXPECT_EQ(device.fileSystem.contentsOf(copyAside), "new");
  EXPECT_TRUE(console().empty());
}

TEST_F(CopyAsideTest, WithoutASettingsFileTheFailureIsLogged) {
  migrator._copyAsideAccountsPlist();

  EXPECT_EQ(console(), Lines{"Error trying to save an accountsettings plist copy: " +
                             std::string(kSettingsPath) + ": No such file or directory"});
}

TEST_F(CopyAsideTest, AnEarlierCopyThatCannotBeRemovedIsLoggedAndTheCopyStillTried) {
  device.fileSystem.addFile(kSettingsPath, "new");
  device.fileSystem.addFile(copyAside, "old");
  device.fileSystem.failWhenLineBegins("remove");

  migrator._copyAsideAccountsPlist();

  EXPECT_EQ(console(), (Lines{"Couldn't remove existing accountsettings copy at " + copyAside,
                              "Error trying to save an accountsettings plist copy: " + copyAside +
                                  ": File exists"}));
}

}  // namespace
}  // namespace accounts
