#include <gtest/gtest.h>

#include <string>

#include "propertylist/PropertyListLimits.h"
#include "tests/propertylist/PropertyListTesting.h"

namespace accounts {
namespace {

using namespace std::string_literals;

TEST(XMLStructure, AWholeDocument) {
  const PropertyValue value = readXML(R"(<?xml version="1.0" encoding="UTF-8"?>
<!DOCTYPE plist SYSTEM "PropertyList-1.0.dtd">
<!-- a comment -->
<plist version="1.0">
<dict>
	<key>Accounts</key>
	<array>
		<dict>
			<key>Identifier</key>
			<string>A</string>
			<key>Active</key>
			<true/>
		</dict>
		<dict/>
	</array>
	<key>Version</key>
	<integer>12</integer>
</dict>
</plist>
)");

  EXPECT_EQ(
      value,
      PropertyValue(PropertyDictionary{
          {"Accounts", PropertyArray{PropertyDictionary{{"Identifier", "A"}, {"Active", true}},
                                     PropertyDictionary{}}},
          {"Version", 12}}));
}

TEST(XMLStructure, DeclarationAndAttributesMayBeMissing) {
  EXPECT_EQ(readXML("<plist><true/></plist>"), PropertyValue(true));
}

TEST(XMLStructure, ADocumentInUTF16IsRead) {
  const std::string document = "<plist><string>x</string></plist>";
  std::string utf16 = "\xFE\xFF";
  for (const char character : document) {
    utf16.push_back('\0');
    utf16.push_back(character);
  }

  EXPECT_EQ(readXML(utf16), PropertyValue("x"));
}

TEST(XMLStructure, EmptyContainers) {
  EXPECT_EQ(readXML(inPropertyList("<dict></dict>")), PropertyValue(PropertyDictionary()));
  EXPECT_EQ(readXML(inPropertyList("<array> </array>")), PropertyValue(PropertyArray()));
}

TEST(XMLStructure, AnEmptyKeyIsAKey) {
  EXPECT_EQ(readXML(inPropertyList("<dict><key/><true/></dict>")),
            PropertyValue(PropertyDictionary{{"", true}}));
}

TEST(XMLStructure, OfTheSameKeyTwiceTheLastOneHolds) {
  EXPECT_EQ(readXML(inPropertyList("<dict><key>k</key><integer>1</integer>"
                                   "<key>k</key><integer>2</integer></dict>")),
            PropertyValue(PropertyDictionary{{"k", 2}}));
}

TEST(XMLStructure, DictionariesWithTheSameKeyShareItsTextInMemory) {
  for (const char* keys : {"<dict><key>a</key><true/><key>b</key><true/></dict>",
                           "<dict><key>b</key><true/><key>a</key><true/></dict>"}) {
    const PropertyValue value =
        readXML(inPropertyList("<array>"s + keys + keys + "<dict/></array>"));

    const PropertyArray& dictionaries = *value.asArray();
    ASSERT_EQ(dictionaries.size(), 3U);
    EXPECT_EQ(dictionaries.at(0), PropertyValue(PropertyDictionary{{"a", true}, {"b", true}}));
    EXPECT_TRUE(dictionaries.at(0).asDictionary()->keys().begin()->bytes().isSameAs(
        dictionaries.at(1).asDictionary()->keys().begin()->bytes()));
    EXPECT_EQ(dictionaries.at(2), PropertyValue(PropertyDictionary()));
  }
}

TEST(XMLStructure, ContainersMayNestAsDeepAsTheLimit) {
  std::string arrays;
  for (std::size_t level = 0; level < kMaximumNestingDepth; ++level) {
    arrays = "<array>" + arrays + "</array>";
  }

  EXPECT_EQ(readXML(inPropertyList(arrays)), nestedArrays(kMaximumNestingDepth));
  EXPECT_TRUE(contains(errorOfReadingXML(inPropertyList("<array>" + arrays + "</array>")),
                       "nested deeper than the limit"));
}

TEST(XMLStructure, AMillionNestedContainersAreRefused) {
  std::string arrays;
  for (int level = 0; level < 1'000'000; ++level) {
    arrays += "<array>";
  }

  EXPECT_TRUE(contains(errorOfReadingXML(inPropertyList(arrays)), "nested deeper than the limit"));
}

TEST(XMLStructure, AMissingPropertyListElementIsRefused) {
  EXPECT_TRUE(contains(errorOfReadingXML("<dict></dict>"), "outermost element is not <plist>"));
  EXPECT_EQ(errorOfReadingXML("<html/>"),
            "XML property list: an element that property lists do not have in line 1");
  EXPECT_TRUE(contains(errorOfReadingXML(""), "no element found"));
  EXPECT_TRUE(contains(errorOfReadingXML("<?xml version=\"1.0\"?>\n"), "no element found"));
}

TEST(XMLStructure, APropertyListWithoutAValueIsRefused) {
  EXPECT_TRUE(contains(errorOfReadingXML("<plist></plist>"), "a <plist> without a value"));
  EXPECT_TRUE(contains(errorOfReadingXML("<plist/>"), "a <plist> without a value"));
}

TEST(XMLStructure, ASecondValueIsRefused) {
  EXPECT_TRUE(contains(errorOfReadingXML("<plist><true/>\n<array/></plist>"),
                       "a second value in <plist>: <array> in line 2"));
}

TEST(XMLStructure, ElementsOutOfPlaceAreRefused) {
  struct OutOfPlace {
    std::string_view content;
    std::string_view error;
  };
  const OutOfPlace table[] = {
      {"<key>k</key>", "a <key> outside a dictionary"},
      {"<array><key>k</key></array>", "a <key> outside a dictionary"},
      {"<dict><true/></dict>", "a value without a key: <true>"},
      {"<dict><key>k</key></dict>", "a key without a value"},
      {"<dict><key>k</key><key>l</key><true/></dict>", "a key without a value"},
      {"<dict><key>k</key><true/><true/></dict>", "a value without a key: <true>"},
      {"<dict><array/></dict>", "a value without a key: <array>"},
      {"<string>a<string>b</string></string>", "an element inside <string>"},
      {"<integer><true/></integer>", "an element inside <integer>"},
      {"<dict><key>a<true/></key><true/></dict>", "an element inside <key>"},
      {"<plist><true/></plist>", "a <plist> inside another"},
      {"<array><plist/></array>", "a <plist> inside another"},
      {"<set/>", "an element that property lists do not have"},
      {"<TRUE/>", "an element that property lists do not have"},
      {"<array>text</array>", "text outside the elements"},
      {"<dict>text</dict>", "text outside the elements"},
      {"text<true/>", "text outside the elements"}};
  for (const OutOfPlace& row : table) {
    EXPECT_TRUE(contains(errorOfReadingXML(inPropertyList(row.content)), row.error));
  }
}

TEST(XMLStructure, TrailingGarbageIsRefused) {
  EXPECT_TRUE(contains(errorOfReadingXML("<plist><true/></plist>x"), "XML property list: "));
  EXPECT_TRUE(contains(errorOfReadingXML("<plist><true/></plist>\n<plist><true/></plist>"),
                       "junk after document element in line 2"));
}

TEST(XMLStructure, BlanksAndCommentsAtTheEndAreNotGarbage) {
  EXPECT_EQ(readXML("<plist><true/></plist>\n\n<!-- end -->\n"), PropertyValue(true));
}

TEST(XMLStructure, AnErrorNamesItsLine) {
  EXPECT_TRUE(
      contains(errorOfReadingXML(inPropertyList("\n\n<array>\n<set/></array>")), "in line 5"));
}

}  // namespace
}  // namespace accounts
