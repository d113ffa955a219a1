#include "platform/linux/DeviceDescription.h"

#include <gtest/gtest.h>

#include "tests/platform/DeviceFixture.h"

namespace accounts {
namespace {

class DeviceDescriptionTest : public DeviceFixture {
 protected:
  std::optional<DeviceDescription> ownDescription() {
    const auto read = readDeviceDescription(root, error);
    return read ? decodeDeviceDescription(*read, error) : std::nullopt;
  }
  std::optional<DeviceDescription> hostDescription(const std::string& name) {
    const auto read = readHostDeviceDescription((outside() / name).string(), error);
    return read ? decodeDeviceDescription(*read, error) : std::nullopt;
  }

  DeviceRoot root = openImage();
  Failure error;
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
  EXPECT_FALSE(ownDescription());
  EXPECT_TRUE(error.text.starts_with("Cannot read the property list /etc/device.plist: "))
      << error.text;
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
  EXPECT_FALSE(hostDescription("none.plist"));
  EXPECT_TRUE(error.isMissing());
}

}  // namespace
}  // namespace accounts
