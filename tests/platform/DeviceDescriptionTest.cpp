#include "platform/linux/DeviceDescription.h"

#include <gtest/gtest.h>

#include "tests/platform/DeviceFixture.h"

namespace accounts {
namespace {

class DeviceDescriptionTest : public DeviceFixture {
 protected:
  OrFailure<DeviceDescription> ownDescription() {
    const auto read = readDeviceDescription(root);
    return read ? decodeDeviceDescription(*read) : read.error();
  }
  OrFailure<DeviceDescription> hostDescription(const std::string& name) {
    const auto read = readHostDeviceDescription((outside() / name).string());
    return read ? decodeDeviceDescription(*read) : read.error();
  }

  DeviceRoot root = openImage();
};

TEST_F(DeviceDescriptionTest, ADeviceWithoutDescriptionHasNoAnswers) {
  const auto description = ownDescription();
  ASSERT_TRUE(description);
  EXPECT_TRUE(description->deviceInfo.empty());
  EXPECT_FALSE(description->pairingValues);
}

TEST_F(DeviceDescriptionTest, TheDevicesOwnDescriptionIsRead) {
  makeFile("/etc/device.plist",
           xmlDictionary("<key>DeviceInfo</key><dict>"
                         "<key>DeviceClass</key><string>Handra</string></dict>"));
  const auto description = ownDescription();
  ASSERT_TRUE(description);
  EXPECT_EQ(description->deviceInfo, (PropertyDictionary{{"DeviceClass", "Handra"}}));
}

TEST_F(DeviceDescriptionTest, AMalformedDescriptionIsAnErrorWithItsPath) {
  makeFile("/etc/device.plist", "no property list");
  const std::string text = failureOf(ownDescription()).text;
  EXPECT_TRUE(text.starts_with("Cannot read the property list /etc/device.plist: ")) << text;
}

TEST_F(DeviceDescriptionTest, ADescriptionThatIsNoDictionaryIsAnError) {
  makeFile("/etc/device.plist", xmlPropertyList("<string>Handra</string>"));
  EXPECT_FALSE(ownDescription());
}

TEST_F(DeviceDescriptionTest, ANamedPipeInPlaceOfTheDescriptionIsAnError) {
  makeNamedPipe("/etc/device.plist");
  EXPECT_FALSE(ownDescription());
}

TEST_F(DeviceDescriptionTest, AHostFileIsReadByItsPath) {
  makeHostFile(outside() / "device.plist", xmlDictionary("<key>PairingValues</key><dict/>"));
  const auto description = hostDescription("device.plist");
  ASSERT_TRUE(description);
  EXPECT_TRUE(description->pairingValues);
}

TEST_F(DeviceDescriptionTest, AMissingHostFileIsAnError) {
  EXPECT_TRUE(failureOf(hostDescription("none.plist")).isMissing());
}

}  // namespace
}  // namespace accounts
