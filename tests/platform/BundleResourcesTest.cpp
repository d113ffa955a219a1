#include <gtest/gtest.h>

#include "platform/linux/LinuxBundleResources.h"
#include "tests/platform/DeviceFixture.h"

namespace accounts {
namespace {

class BundleResourcesTest : public DeviceFixture {
 protected:
  LinuxBundleResources resources{outside().string()};
};

TEST_F(BundleResourcesTest, AResourceIsReadByItsName) {
  makeHostFile(outside() / "Types.plist", xmlDictionary("<key>Mail</key><string>IMAP</string>"));
  EXPECT_TRUE(resources.hasPropertyList("Types"));
  const auto dictionary = resources.readPropertyList("Types");
  ASSERT_TRUE(dictionary);
  EXPECT_EQ(*dictionary, (PropertyDictionary{{"Mail", "IMAP"}}));
}

TEST_F(BundleResourcesTest, AMissingResourceIsNotThere) {
  EXPECT_FALSE(resources.hasPropertyList("Types"));
  EXPECT_FALSE(resources.readPropertyList("Types"));
}

TEST_F(BundleResourcesTest, AMalformedResourceIsThereButHoldsNothing) {
  makeHostFile(outside() / "Types.plist", "no property list");
  EXPECT_TRUE(resources.hasPropertyList("Types"));
  EXPECT_FALSE(resources.readPropertyList("Types"));
}

TEST_F(BundleResourcesTest, AResourceThatIsNoDictionaryHoldsNothing) {
  makeHostFile(outside() / "Types.plist", xmlPropertyList("<array/>"));
  EXPECT_FALSE(resources.readPropertyList("Types"));
}

TEST_F(BundleResourcesTest, ADirectoryInPlaceOfAResourceHoldsNothing) {
  std::filesystem::create_directory(outside() / "Types.plist");
  EXPECT_FALSE(resources.readPropertyList("Types"));
}

TEST_F(BundleResourcesTest, ANamedPipeInPlaceOfAResourceIsNotWaitedFor) {
  makeNamedPipe("/Types.plist");
  LinuxBundleResources withPipe(image().string());
  EXPECT_FALSE(withPipe.readPropertyList("Types"));
}

}  // namespace
}  // namespace accounts
