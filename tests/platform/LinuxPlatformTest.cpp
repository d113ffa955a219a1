#include "platform/linux/LinuxPlatform.h"

#include <gtest/gtest.h>

#include "tests/platform/DeviceFixture.h"

namespace accounts {
namespace {

using Kind = LinuxPlatformError::Kind;
namespace fs = std::filesystem;

TEST(RecordingTest, AnnouncedChangesAreKeptInOrder) {
  RecordingPreferencesBroadcast broadcast;
  broadcast.announceChange("com.quarx.mobilemail", "MailAccounts");
  broadcast.announceChange("other", "key");
  const std::vector<PreferencesChange> expected = {{"com.quarx.mobilemail", "MailAccounts"},
                                                   {"other", "key"}};
  EXPECT_EQ(broadcast.changes(), expected);
}

TEST(RecordingTest, AnnouncedCloudTabsAreKeptInOrder) {
  RecordingCloudTabService service;
  service.announce(CloudTabs::On);
  service.announce(CloudTabs::Off);
  EXPECT_EQ(service.announcements(), (std::vector{CloudTabs::On, CloudTabs::Off}));
}

class LinuxPlatformTest : public DeviceFixture {
 protected:
  LinuxPlatformTest() {
    fs::create_directory(resources());
    makeDirectory("/var/mobile");
    makeDirectory("/users/one");
    options.rootDirectory = image().string();
    options.bundleResourcesDirectory = resources().string();
  }

  [[nodiscard]] fs::path resources() const { return outside() / "Resources"; }
  /// Null, with `error` set, when it cannot be made.
  std::unique_ptr<LinuxPlatform> create() {
    auto made = LinuxPlatform::create(options);
    if (!made) {
      error = made.error();
    }
    return std::move(made).value_or(nullptr);
  }

  LinuxPlatformOptions options;
  LinuxPlatformError error;
};

TEST_F(LinuxPlatformTest, MakingItChangesNothingOnTheDevice) {
  ASSERT_TRUE(create());
  EXPECT_EQ(namesIn("/"), (std::vector<std::string>{"users", "var"}));
  EXPECT_TRUE(namesIn("/var/mobile").empty());
}

TEST_F(LinuxPlatformTest, TheHomeDirectoryIsTheMobileUsersUnlessNamed) {
  const auto usual = create();
  ASSERT_TRUE(usual);
  EXPECT_EQ(usual->platform().homeDirectory.path(), "/var/mobile");
  options.homeDirectory = "/users/one/";
  const auto named = create();
  ASSERT_TRUE(named);
  EXPECT_EQ(named->platform().homeDirectory.path(), "/users/one");
  EXPECT_EQ(named->platform().mailDirectory.path(), "/users/one/Library/Mail");
}

TEST_F(LinuxPlatformTest, TemporaryFilesGoToTheHomeDirectoryUnlessToldOtherwise) {
  options.homeDirectory = "/users/one";
  const auto usual = create();
  ASSERT_TRUE(usual);
  EXPECT_TRUE(usual->platform().fileSystem.makeTemporaryFile());
  EXPECT_EQ(namesIn("/users/one/tmp").size(), 1u);
  options.temporaryDirectory = "/var/temporary";
  const auto named = create();
  ASSERT_TRUE(named);
  EXPECT_TRUE(named->platform().fileSystem.makeTemporaryFile());
  EXPECT_EQ(namesIn("/var/temporary").size(), 1u);
}

TEST_F(LinuxPlatformTest, AllOfItWorksOnTheOneRoot) {
  makeFile("/var/mobile/Library/Preferences/domain.plist",
           xmlDictionary("<key>Key</key><string>value</string>"));
  const auto made = create();
  ASSERT_TRUE(made);
  Platform& platform = made->platform();
  const std::string path = "/var/mobile/Library/Preferences/domain.plist";
  EXPECT_TRUE(platform.fileSystem.fileExists(path));
  EXPECT_TRUE(platform.propertyLists.readDictionary(path));
  EXPECT_EQ(platform.preferenceDomain.copyValue("Key", "domain"), PropertyValue("value"));
  EXPECT_FALSE(platform.sharedResources.makeLock("Lock"));
  makeDirectory("/tmp");
  EXPECT_TRUE(platform.sharedResources.makeLock("Lock"));
}

TEST_F(LinuxPlatformTest, TheDevicesOwnDescriptionAnswersUnlessAnotherIsNamed) {
  makeFile("/etc/device.plist", xmlDictionary("<key>DeviceInfo</key><dict><key>DeviceClass</key>"
                                              "<string>Own</string></dict>"));
  const auto own = create();
  ASSERT_TRUE(own);
  EXPECT_EQ(own->platform().deviceInfoService.copyAnswer("DeviceClass"), PropertyValue("Own"));
  makeHostFile(outside() / "device.plist",
               xmlDictionary("<key>CloudAccount</key><dict><key>DisplayName</key>"
                             "<string>Named</string></dict>"));
  options.deviceDescriptionFile = (outside() / "device.plist").string();
  const auto named = create();
  ASSERT_TRUE(named);
  EXPECT_EQ(named->platform().deviceInfoService.copyAnswer("DeviceClass"), std::nullopt);
  EXPECT_EQ(named->platform().cloudAccountService.accountTypeDisplayName(), "Named");
}

TEST_F(LinuxPlatformTest, TheBundlesResourcesAreThoseOfTheGivenDirectory) {
  makeHostFile(resources() / "Types.plist", xmlDictionary(""));
  fs::create_directory(resources() / "en.lproj");
  makeHostFile(resources() / "en.lproj" / "Table.strings",
               xmlDictionary("<key>KEY</key><string>Text</string>"));
  const auto made = create();
  ASSERT_TRUE(made);
  EXPECT_TRUE(made->platform().bundleResources.hasPropertyList("Types"));
  EXPECT_EQ(made->platform().localizedStrings.localizedString("KEY", "", "Table"), "Text");
}

TEST_F(LinuxPlatformTest, TheChannelIsOffUnlessAskedFor) {
  const auto off = create();
  ASSERT_TRUE(off);
  EXPECT_FALSE(off->platform().logSystem.makeChannel("one", "two").isEnabled());
  options.channel = (outside() / "channel.log").string();
  const auto on = create();
  ASSERT_TRUE(on);
  on->platform().logSystem.makeChannel("one", "two").write({.text = "line"});
  EXPECT_EQ(hostFileContents(outside() / "channel.log"), "[one:two] line\n");
}

TEST_F(LinuxPlatformTest, TheJournalIsAChannelThatMustBeThere) {
  options.channel = "journal";
  options.journalSocket = (outside() / "socket").string();
  EXPECT_FALSE(create());
  EXPECT_EQ(error.kind, Kind::CannotCreate);
  EXPECT_FALSE(fs::exists("journal"));
}

TEST_F(LinuxPlatformTest, AFileCalledJournalIsNamedWithItsDirectory) {
  options.channel = (outside() / "journal").string();
  const auto made = create();
  ASSERT_TRUE(made);
  made->platform().logSystem.makeChannel("one", "two").write({.text = "line"});
  EXPECT_EQ(hostFileContents(outside() / "journal"), "[one:two] line\n");
}

TEST_F(LinuxPlatformTest, WhatThePluginAnnouncesCanBeReadBack) {
  const auto made = create();
  ASSERT_TRUE(made);
  made->platform().preferencesBroadcast.announceChange("application", "key");
  made->platform().cloudTabService.announce(CloudTabs::On);
  EXPECT_EQ(made->preferencesBroadcast().changes().size(), 1u);
  EXPECT_EQ(made->cloudTabService().announcements().size(), 1u);
}

TEST_F(LinuxPlatformTest, AMissingRootIsAMissingInputThatIsNamed) {
  options.rootDirectory = (outside() / "none").string();
  EXPECT_FALSE(create());
  EXPECT_EQ(error.kind, Kind::MissingInput);
  EXPECT_EQ(error.failure.text,
            "Cannot open the device root " + options.rootDirectory + ": No such file or directory");
}

TEST_F(LinuxPlatformTest, AMissingBundleIsAMissingInput) {
  options.bundleResourcesDirectory = (outside() / "none").string();
  EXPECT_FALSE(create());
  EXPECT_EQ(error.kind, Kind::MissingInput);
}

TEST_F(LinuxPlatformTest, ANamedDescriptionThatIsMissingOrMalformedIsAMissingInput) {
  options.deviceDescriptionFile = (outside() / "device.plist").string();
  EXPECT_FALSE(create());
  EXPECT_EQ(error.kind, Kind::MissingInput);
  makeHostFile(*options.deviceDescriptionFile, "no property list");
  EXPECT_FALSE(create());
  EXPECT_EQ(error.kind, Kind::MissingInput);
}

TEST_F(LinuxPlatformTest, AChannelThatCannotBeMadeCannotBeCreated) {
  options.channel = (outside() / "none" / "channel.log").string();
  EXPECT_FALSE(create());
  EXPECT_EQ(error.kind, Kind::CannotCreate);
}

TEST_F(LinuxPlatformTest, NoChannelIsMadeForAPlatformThatCannotBe) {
  options.channel = (outside() / "channel.log").string();
  options.rootDirectory = (outside() / "none").string();
  EXPECT_FALSE(create());
  EXPECT_FALSE(fs::exists(*options.channel));
}

TEST_F(LinuxPlatformTest, DirectoriesThatAreNoAbsoluteDevicePathsAreUnusable) {
  options.homeDirectory = "var/mobile";
  EXPECT_FALSE(create());
  EXPECT_EQ(error.kind, Kind::UnusableOption);
  EXPECT_EQ(error.failure.text,
            "The home directory \"var/mobile\" is not an absolute path of the device");
  options.homeDirectory = "/var/mobile";
  options.temporaryDirectory = "";
  EXPECT_FALSE(create());
  EXPECT_EQ(error.kind, Kind::UnusableOption);
}

}  // namespace
}  // namespace accounts
