#include <gtest/gtest.h>

#include "platform/linux/LinuxBundleResources.h"
#include "tests/platform/DeviceFixture.h"

namespace accounts {
namespace {

class BundleResourcesTest : public DeviceFixture {
 protected:
  BundleFiles files{outside().string()};
  LinuxBundleResources resources{files};
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
  const BundleFiles filesWithPipe(image().string());
  LinuxBundleResources withPipe(filesWithPipe);
  EXPECT_FALSE(withPipe.readPropertyList("Types"));
}

TEST_F(BundleResourcesTest, WhatWasReadAheadNeedsNoFileAnyMore) {
  makeHostFile(outside() / "Types.plist", xmlDictionary("<key>Mail</key><string>IMAP</string>"));
  std::filesystem::create_directory(outside() / "en.lproj");
  makeHostFile(outside() / "en.lproj" / "Table.strings", "a table");

  ASSERT_TRUE(files.readAhead());
  std::filesystem::remove_all(outside());

  EXPECT_TRUE(resources.hasPropertyList("Types"));
  EXPECT_EQ(resources.readPropertyList("Types"), (PropertyDictionary{{"Mail", "IMAP"}}));
  EXPECT_EQ(files.read("en.lproj/Table.strings"), "a table");
}

TEST_F(BundleResourcesTest, WhatCannotBeReadAheadIsThereButHoldsNothing) {
  std::filesystem::create_symlink("/dev/null", outside() / "Types.plist");

  ASSERT_TRUE(files.readAhead());

  EXPECT_TRUE(resources.hasPropertyList("Types"));
  EXPECT_FALSE(resources.readPropertyList("Types"));
  EXPECT_FALSE(resources.hasPropertyList("Others"));
  EXPECT_TRUE(failureOf(files.read("Others.plist")).isMissing());
}

}  // namespace
}  // namespace accounts
