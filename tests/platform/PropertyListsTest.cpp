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
};

TEST_F(PropertyListsTest, AnXMLFileIsRead) {
  makeFile("/file.plist", xmlDictionary("<key>Version</key><integer>12</integer>"));
  const auto dictionary = propertyLists.readDictionary("/file.plist");
  ASSERT_TRUE(dictionary);
  EXPECT_EQ(*dictionary, (PropertyDictionary{{"Version", 12}}));
}

TEST_F(PropertyListsTest, ABinaryFileThatWasWrittenHereIsRead) {
  const PropertyDictionary original = {{"Accounts", PropertyArray{"one", 2, true}}};
  std::string_view bytes;
  ASSERT_TRUE(propertyLists.serializeBinary(original, bytes));
  makeFile("/file.plist", bytes);
  const auto dictionary = propertyLists.readDictionary("/file.plist");
  ASSERT_TRUE(dictionary);
  EXPECT_EQ(*dictionary, original);
}

/// Writes a dictionary to a file, so that it is the one remembered.
std::string writeAndRemember(LinuxPropertyLists& propertyLists, const PropertyDictionary& value) {
  std::string_view bytes;
  EXPECT_TRUE(propertyLists.serializeBinary(value, bytes));
  return std::string(bytes);
}

TEST_F(PropertyListsTest, AFileThatStillHoldsWhatWasWrittenGivesTheSameDictionary) {
  const PropertyDictionary written = {{"Name", "value"}};
  makeFile("/file.plist", writeAndRemember(propertyLists, written));

  const auto dictionary = propertyLists.readDictionary("/file.plist");

  ASSERT_TRUE(dictionary);
  EXPECT_TRUE(dictionary->isSameAs(written));
}

TEST_F(PropertyListsTest, AFileWithOneOtherByteThanWhatWasWrittenIsDecoded) {
  std::string bytes = writeAndRemember(propertyLists, {{"Name", "value"}});
  bytes.replace(bytes.find("value"), 5, "Value");
  makeFile("/file.plist", bytes);

  EXPECT_EQ(propertyLists.readDictionary("/file.plist"), (PropertyDictionary{{"Name", "Value"}}));
}

TEST_F(PropertyListsTest, AFileThatIsOnlyTheBeginningOfWhatWasWrittenIsMalformed) {
  const std::string bytes = writeAndRemember(propertyLists, {{"Name", "value"}});
  makeFile("/file.plist", bytes.substr(0, bytes.size() - 1));

  EXPECT_FALSE(propertyLists.readDictionary("/file.plist"));
}

TEST_F(PropertyListsTest, AFileThatGoesOnAfterWhatWasWrittenIsDecoded) {
  const std::string bytes = writeAndRemember(propertyLists, {{"Name", "value"}});
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
  std::string_view bytes;
  ASSERT_TRUE(propertyLists.serializeBinary(PropertyArray{1}, bytes));
  makeFile("/file.plist", bytes);

  EXPECT_FALSE(propertyLists.readDictionary("/file.plist"));
}

TEST_F(PropertyListsTest, AnEqualValueIsNotEncodedAgain) {
  std::string_view first;
  ASSERT_TRUE(propertyLists.serializeBinary(PropertyDictionary{{"Version", 12}}, first));
  std::string_view second;
  ASSERT_TRUE(propertyLists.serializeBinary(PropertyDictionary{{"Version", 12}}, second));
  EXPECT_EQ(static_cast<const void*>(second.data()), static_cast<const void*>(first.data()));
}

TEST_F(PropertyListsTest, AnotherValueIsEncodedAsItIs) {
  std::string_view bytes;
  ASSERT_TRUE(propertyLists.serializeBinary(PropertyDictionary{{"Version", 12}}, bytes));
  const std::string first(bytes);
  ASSERT_TRUE(propertyLists.serializeBinary(PropertyDictionary{{"Version", 13}}, bytes));
  EXPECT_NE(bytes, first);
  ASSERT_TRUE(propertyLists.serializeBinary(PropertyDictionary{{"Version", 12}}, bytes));
  EXPECT_EQ(bytes, first);
}

TEST_F(PropertyListsTest, AValueThatWasReadIsEncodedOurWayAndNotTheFilesOwn) {
  makeFile("/file.plist", xmlDictionary("<key>Version</key><integer>12</integer>"));
  const auto read = propertyLists.readDictionary("/file.plist");
  ASSERT_TRUE(read);
  std::string_view bytes;
  ASSERT_TRUE(propertyLists.serializeBinary(*read, bytes));
  EXPECT_TRUE(bytes.starts_with("bplist00"));
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
  std::string_view bytes = "left over";
  const Result result = propertyLists.serializeBinary(value, bytes);
  ASSERT_FALSE(result);
  EXPECT_FALSE(result.error().empty());
  EXPECT_TRUE(bytes.empty());
}

}  // namespace
}  // namespace accounts
