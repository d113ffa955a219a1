#include <gtest/gtest.h>

#include "platform/linux/DictionaryFile.h"
#include "platform/linux/LinuxPropertyLists.h"
#include "propertylist/PropertyListLimits.h"
#include "tests/platform/DeviceFixture.h"

namespace accounts {
namespace {

namespace fs = std::filesystem;

class PropertyListsTest : public DeviceFixture {
 protected:
  DeviceRoot root = openImage();
  LinuxPropertyLists propertyLists{root};

  SerializedPropertyList serialize(const PropertyValue& value) {
    return propertyLists.serializeBinary(value).value();
  }
};

TEST_F(PropertyListsTest, AnXMLFileIsRead) {
  makeFile("/file.plist", xmlDictionary("<key>Version</key><integer>12</integer>"));
  const auto dictionary = propertyLists.readDictionary("/file.plist");
  ASSERT_TRUE(dictionary);
  EXPECT_EQ(*dictionary, (PropertyDictionary{{"Version", 12}}));
}

TEST_F(PropertyListsTest, ABinaryFileThatWasWrittenHereIsRead) {
  const PropertyDictionary original = {{"Accounts", PropertyArray{"one", 2, true}}};
  makeFile("/file.plist", bytesOf(serialize(original)));
  const auto dictionary = propertyLists.readDictionary("/file.plist");
  ASSERT_TRUE(dictionary);
  EXPECT_EQ(*dictionary, original);
}

TEST_F(PropertyListsTest, AFileThatChangedSinceItWasReadIsReadAsItIsNow) {
  makeFile("/file.plist", xmlDictionary("<key>Version</key><integer>1</integer>"));
  ASSERT_TRUE(propertyLists.readDictionary("/file.plist"));
  makeFile("/file.plist", xmlDictionary("<key>Version</key><integer>2</integer>"));

  EXPECT_EQ(propertyLists.readDictionary("/file.plist"), (PropertyDictionary{{"Version", 2}}));
}

TEST_F(PropertyListsTest, WhatIsSerialisedKeepsItsValueWhateverIsSerialisedLater) {
  const SerializedPropertyList first = serialize(PropertyDictionary{{"Version", 12}});
  const SerializedPropertyList second = serialize(PropertyDictionary{{"Version", 13}});

  makeFile("/first.plist", bytesOf(first));
  makeFile("/second.plist", bytesOf(second));

  EXPECT_EQ(propertyLists.readDictionary("/first.plist"), (PropertyDictionary{{"Version", 12}}));
  EXPECT_EQ(propertyLists.readDictionary("/second.plist"), (PropertyDictionary{{"Version", 13}}));
}

TEST_F(PropertyListsTest, AValueThatWasReadIsEncodedOurWayAndNotTheFilesOwn) {
  makeFile("/file.plist", xmlDictionary("<key>Version</key><integer>12</integer>"));
  const auto read = propertyLists.readDictionary("/file.plist");
  ASSERT_TRUE(read);
  EXPECT_TRUE(bytesOf(serialize(*read)).starts_with("bplist00"));
}

TEST_F(PropertyListsTest, AMissingOrMalformedFileHoldsNoDictionary) {
  makeFile("/malformed.plist", "bplist00 and no more");
  EXPECT_FALSE(propertyLists.readDictionary("/missing.plist"));
  EXPECT_FALSE(propertyLists.readDictionary("/malformed.plist"));
}

TEST_F(PropertyListsTest, TheErrorOfMalformedBytesNamesTheirPathAndIsNotThatOfAMissingFile) {
  const Failure failure = failureOf(dictionaryFromBytes("no property list", "/malformed.plist"));
  EXPECT_TRUE(failure.text.starts_with("Cannot read the property list /malformed.plist: "))
      << failure.text;
  EXPECT_FALSE(failure.isMissing());
}

TEST_F(PropertyListsTest, AnEmptyFileHoldsNoDictionary) {
  makeFile("/empty.plist", "");
  EXPECT_FALSE(propertyLists.readDictionary("/empty.plist"));
}

TEST_F(PropertyListsTest, AFileThatHoldsSomethingElseHoldsNoDictionary) {
  makeFile("/array.plist", xmlPropertyList("<array/>"));
  EXPECT_FALSE(propertyLists.readDictionary("/array.plist"));
  EXPECT_EQ(failureOf(dictionaryFromBytes(xmlPropertyList("<array/>"), "/array.plist")).text,
            "Cannot read the property list /array.plist: Its root is not a dictionary");
}

TEST_F(PropertyListsTest, AFileWithoutReadPermissionHoldsNoDictionary) {
  makeFile("/file.plist", xmlDictionary(""));
  fs::permissions(onHost("/file.plist"), fs::perms::none);
  const WithoutPrivileges restricted;
  EXPECT_FALSE(propertyLists.readDictionary("/file.plist"));
}

TEST_F(PropertyListsTest, ANamedPipeHoldsNoDictionaryAndIsNotWaitedFor) {
  makeNamedPipe("/file.plist");
  EXPECT_FALSE(propertyLists.readDictionary("/file.plist"));
}

TEST_F(PropertyListsTest, AFileOutsideTheRootIsNotReadThroughALink) {
  makeHostFile(outside() / "file.plist", xmlDictionary(""));
  makeLink("/file.plist", outside() / "file.plist");
  EXPECT_FALSE(propertyLists.readDictionary("/file.plist"));
}

TEST_F(PropertyListsTest, AValueNestedTooDeeplyIsNotSerialised) {
  PropertyValue value = "leaf";
  for (std::size_t depth = 0; depth <= kMaximumNestingDepth; ++depth) {
    value = PropertyArray{value};
  }
  const auto serialized = propertyLists.serializeBinary(value);
  ASSERT_FALSE(serialized);
  EXPECT_FALSE(serialized.error().text.empty());
}

}  // namespace
}  // namespace accounts
