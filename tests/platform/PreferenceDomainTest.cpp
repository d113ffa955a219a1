#include <gtest/gtest.h>

#include "platform/linux/LinuxHomeDirectory.h"
#include "platform/linux/LinuxPreferenceDomain.h"
#include "platform/linux/LinuxPropertyLists.h"
#include "tests/platform/DeviceFixture.h"

namespace accounts {
namespace {

constexpr std::string_view kFile = "/home/Library/Preferences/com.quarx.test.plist";

class PreferenceDomainTest : public DeviceFixture {
 protected:
  DeviceRoot root = openImage();
  LinuxPropertyLists propertyLists{root};
  LinuxHomeDirectory home{"/home"};
  LinuxPreferenceDomain preferences{propertyLists, home};
};

TEST_F(PreferenceDomainTest, AValueComesFromTheDomainsFile) {
  makeFile(kFile, xmlDictionary("<key>Save</key><true/>"));
  EXPECT_EQ(preferences.copyValue("Save", "com.quarx.test"), PropertyValue(true));
}

TEST_F(PreferenceDomainTest, AMissingKeyHasNoValue) {
  makeFile(kFile, xmlDictionary("<key>Save</key><true/>"));
  EXPECT_EQ(preferences.copyValue("Load", "com.quarx.test"), std::nullopt);
}

TEST_F(PreferenceDomainTest, AMissingDomainHasNoValues) {
  EXPECT_EQ(preferences.copyValue("Save", "com.quarx.test"), std::nullopt);
}

TEST_F(PreferenceDomainTest, AnUnreadableDomainHasNoValues) {
  makeFile(kFile, "no property list");
  EXPECT_EQ(preferences.copyValue("Save", "com.quarx.test"), std::nullopt);
}

TEST_F(PreferenceDomainTest, AfterSynchronisingAReadSeesWhatOthersWrote) {
  makeFile(kFile, xmlDictionary("<key>Save</key><false/>"));
  ASSERT_EQ(preferences.copyValue("Save", "com.quarx.test"), PropertyValue(false));
  makeFile(kFile, xmlDictionary("<key>Save</key><true/>"));
  preferences.synchronize("com.quarx.test");
  EXPECT_EQ(preferences.copyValue("Save", "com.quarx.test"), PropertyValue(true));
}

TEST_F(PreferenceDomainTest, ADomainIsOneFileNameOnly) {
  makeFile("/home/Library/other.plist", xmlDictionary("<key>Save</key><true/>"));
  makeDirectory("/home/Library/Preferences");
  EXPECT_EQ(preferences.copyValue("Save", "../other"), std::nullopt);
}

}  // namespace
}  // namespace accounts
