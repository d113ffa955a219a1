#include <sys/mount.h>

#include <fstream>
#include <string>

#include "tests/program/DeviceRootFixture.h"

namespace accounts {
namespace {

constexpr const char* kHome = "/var/mobile";

/// A device whose home directory is a file system of its own, and full.
class FullDisk : public DeviceRootFixture {
 protected:
  void SetUp() override {
    mounted_ = mount("none", onThisMachine(kHome).c_str(), "tmpfs", 0, "size=256k") == 0;
    if (!mounted_) {
      GTEST_SKIP() << "This system lets the test mount no file system.";
    }
    write(kSettingsPath, accountSettings(11, {PropertyDictionary{{"Type", "CalDAV"},
                                                                 {"Class", "MobileCalDAVAccount"},
                                                                 {"Identifier", "one"}}}));
    write(kLegacyMailPath, PropertyDictionary{{"MailAccounts", PropertyArray{}}});
  }

  void TearDown() override {
    if (mounted_) {
      umount2(onThisMachine(kHome).c_str(), MNT_DETACH);
    }
  }

  /// Leaves no room for a single byte.
  void fill() const {
    std::ofstream stream(onThisMachine("/var/mobile/filling"), std::ios::binary);
    const std::string page(4096, 'x');
    while (stream.write(page.data(), static_cast<std::streamsize>(page.size())).flush()) {
    }
  }

 private:
  bool mounted_ = false;
};

TEST_F(FullDisk, LeavesTheSettingsFileAsItWas) {
  const std::string settingsBefore = readText(kSettingsPath);
  fill();

  const ProgramResult result = migrate({"--channel", "-"});

  EXPECT_NE(result.errors.find("\"Failed to save accounts to filesystem.\""), std::string::npos)
      << result.errors;
  EXPECT_EQ(readText(kSettingsPath), settingsBefore);
}

TEST_F(FullDisk, WithRoomIsMigrated) {
  ASSERT_EQ(migrate().exitStatus, 0);

  EXPECT_EQ(readDictionary(kSettingsPath).find("Version")->integerValue(), 12);
  EXPECT_FALSE(exists(kLegacyMailPath));
}

}  // namespace
}  // namespace accounts
