#include <gtest/gtest.h>

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
  PathError error;

  /// Takes all bytes of a value, so that the value is the one remembered.
  std::string bytesOf(const PropertyValue& value) {
    BytesInPieces bytes;
    EXPECT_TRUE(propertyLists.serializeBinary(value, bytes));
    return bytes.whole();
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
  makeFile("/file.plist", bytesOf(original));
  const auto dictionary = propertyLists.readDictionary("/file.plist");
  ASSERT_TRUE(dictionary);
  EXPECT_EQ(*dictionary, original);
}

TEST_F(PropertyListsTest, AFileThatStillHoldsWhatWasWrittenGivesTheSameDictionary) {
  const PropertyDictionary written = {{"Name", "value"}};
  makeFile("/file.plist", bytesOf(written));

  const auto dictionary = propertyLists.readDictionary("/file.plist");

  ASSERT_TRUE(dictionary);
  EXPECT_TRUE(dictionary->isSameAs(written));
}

TEST_F(PropertyListsTest, AFileWithOneOtherByteThanWhatWasWrittenIsDecoded) {
  std::string bytes = bytesOf(PropertyDictionary{{"Name", "value"}});
  bytes.replace(bytes.find("value"), 5, "Value");
  makeFile("/file.plist", bytes);

  EXPECT_EQ(propertyLists.readDictionary("/file.plist"), (PropertyDictionary{{"Name", "Value"}}));
}

TEST_F(PropertyListsTest, AFileThatIsOnlyTheBeginningOfWhatWasWrittenIsMalformed) {
  const std::string bytes = bytesOf(PropertyDictionary{{"Name", "value"}});
  makeFile("/file.plist", bytes.substr(0, bytes.size() - 1));

  EXPECT_FALSE(propertyLists.readDictionary("/file.plist"));
}

TEST_F(PropertyListsTest, AFileThatGoesOnAfterWhatWasWrittenIsDecoded) {
  const std::string bytes = bytesOf(PropertyDictionary{{"Name", "value"}});
  makeFile("/file.plist", bytes + "more");

  EXPECT_FALSE(propertyLists.readDictionary("/file.plist", error));
  EXPECT_TRUE(error.text.starts_with("Cannot read the property list")) << error.text;
}

TEST_F(PropertyListsTest, AFileThatWasReadGivesTheSameDictionaryUntilItChanges) {
  makeFile("/file.plist", xmlDictionary("<key>Version</key><integer>1</integer>"));
  const auto first = propertyLists.readDictionary("/file.plist");
  const auto second = propertyLists.readDictionary("/file.plist");
  makeFile("/file.plist", xmlDictionary("<key>Version</key><integer>2</integer>"));
  const auto third = propertyLists.readDictionary("/file.plist");

  ASSERT_TRUE(first && second);
  EXPECT_TRUE(second->isSameAs(*first));
  EXPECT_EQ(third, (PropertyDictionary{{"Version", 2}}));
}

TEST_F(PropertyListsTest, WhatWasWrittenOtherThanADictionaryIsNoDictionaryWhenRead) {
  makeFile("/file.plist", bytesOf(PropertyArray{1}));

  EXPECT_FALSE(propertyLists.readDictionary("/file.plist"));
}

TEST_F(PropertyListsTest, WhatWasNotTakenToItsEndIsNotRemembered) {
  const PropertyDictionary written = {{"Name", "value"}};
  BytesInPieces bytes;
  ASSERT_TRUE(propertyLists.serializeBinary(written, bytes));
  EXPECT_FALSE(bytes.giveTo([](std::string_view) { return false; }));
  PropertyListError malformed;
  makeFile("/file.plist", writeBinaryPropertyList(written, malformed).value());

  const auto dictionary = propertyLists.readDictionary("/file.plist");

  ASSERT_TRUE(dictionary);
  EXPECT_FALSE(dictionary->isSameAs(written));
}

TEST_F(PropertyListsTest, ValuesWrittenOneAfterTheOtherAreEncodedAsTheyAre) {
  const std::string first = bytesOf(PropertyDictionary{{"Version", 12}});
  EXPECT_NE(bytesOf(PropertyDictionary{{"Version", 13}}), first);
  EXPECT_EQ(bytesOf(PropertyDictionary{{"Version", 12}}), first);
}

TEST_F(PropertyListsTest, AValueThatWasReadIsEncodedOurWayAndNotTheFilesOwn) {
  makeFile("/file.plist", xmlDictionary("<key>Version</key><integer>12</integer>"));
  const auto read = propertyLists.readDictionary("/file.plist");
  ASSERT_TRUE(read);
  EXPECT_TRUE(bytesOf(*read).starts_with("bplist00"));
}

TEST_F(PropertyListsTest, AMissingFileIsToldFromAnUnreadableOne) {
  makeFile("/malformed.plist", "bplist00 and no more");
  EXPECT_FALSE(propertyLists.readDictionary("/missing.plist", error));
  EXPECT_TRUE(error.isMissing());
  EXPECT_FALSE(propertyLists.readDictionary("/malformed.plist", error));
  EXPECT_FALSE(error.isMissing());
}

TEST_F(PropertyListsTest, TheErrorOfAMalformedFileNamesItsPath) {
  makeFile("/malformed.plist", "no property list");
  EXPECT_FALSE(propertyLists.readDictionary("/malformed.plist", error));
  EXPECT_TRUE(error.text.starts_with("Cannot read the property list /malformed.plist: "))
      << error.text;
}

TEST_F(PropertyListsTest, AnEmptyFileHoldsNoDictionary) {
  makeFile("/empty.plist", "");
  EXPECT_FALSE(propertyLists.readDictionary("/empty.plist"));
}

TEST_F(PropertyListsTest, AFileThatHoldsSomethingElseHoldsNoDictionary) {
  makeFile("/array.plist", xmlPropertyList("<array/>"));
  EXPECT_FALSE(propertyLists.readDictionary("/array.plist", error));
  EXPECT_EQ(error.text, "Cannot read the property list /array.plist: Its root is not a dictionary");
  EXPECT_FALSE(error.isMissing());
}

TEST_F(PropertyListsTest, AFileWithoutReadPermissionHoldsNoDictionary) {
  makeFile("/file.plist", xmlDictionary(""));
  fs::permissions(onHost("/file.plist"), fs::perms::none);
  const WithoutPrivileges restricted;
  EXPECT_FALSE(propertyLists.readDictionary("/file.plist", error));
  EXPECT_EQ(error.text, "Cannot open /file.plist: Permission denied");
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
  BytesInPieces bytes = "left over";
  const Result result = propertyLists.serializeBinary(value, bytes);
  ASSERT_FALSE(result);
  EXPECT_FALSE(result.error().empty());
  EXPECT_EQ(bytes.size(), 0u);
}

}  // namespace
}  // namespace accounts
