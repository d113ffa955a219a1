#include <gtest/gtest.h>

#include <bit>
#include <cmath>
#include <limits>
#include <string>
#include <vector>

#include "propertylist/PropertyListLimits.h"
#include "tests/propertylist/PropertyListTesting.h"

namespace accounts {
namespace {

std::string errorOfWritingXML(const PropertyValue& value) {
  const auto bytes = writeXMLPropertyList(value);
  EXPECT_FALSE(bytes);
  return bytes ? "" : bytes.error().text;
}

/// The value is written, and read as it was.
void expectKept(const PropertyValue& value) {
  EXPECT_EQ(readXML(writeXML(value)), value) << writeXML(value);
}

TEST(XMLWriting, EveryKindIsReadAsItWasWritten) {
  expectKept(valueOfEveryKindInXML());
}

TEST(XMLWriting, AFileIsIndentedWithItsKeysInOrder) {
  const PropertyValue value =
      PropertyDictionary{{"b", PropertyArray{1, true}}, {"a", PropertyDictionary{}}};

  EXPECT_EQ(writeXML(value),
            "<?xml version=\"1.0\" encoding=\"UTF-8\"?>\n"
            "<plist version=\"1.0\">\n"
            "<dict>\n"
            "  <key>a</key>\n"
            "  <dict/>\n"
            "  <key>b</key>\n"
            "  <array>\n"
            "    <integer>1</integer>\n"
            "    <true/>\n"
            "  </array>\n"
            "</dict>\n"
            "</plist>\n");
}

TEST(XMLWriting, AScalarMayStandAlone) {
  EXPECT_TRUE(contains(writeXML("text"), ">\n<string>text</string>\n</plist>\n"));
}

TEST(XMLWriting, WhatXMLReservesIsEscapedInTextsAndKeys) {
  const PropertyValue value = PropertyDictionary{{"<&>", "]]> & </string> \"'"}};

  EXPECT_TRUE(contains(writeXML(value), "<key>&lt;&amp;&gt;</key>"));
  expectKept(value);
}

TEST(XMLWriting, BlanksAndLineEndsInTextsAreKept) {
  for (const char* text : {" ", "\n", "\t", "\r", "\r\n", " a ", "a\r\nb\rc\nd", ""}) {
    expectKept(text);
    expectKept(PropertyDictionary{{text, 1}});
  }
}

TEST(XMLWriting, WhatATerminalMightObeyIsWrittenAsItsNumber) {
  const PropertyValue value = PropertyDictionary{{"\x7F", "\u0080a\u202E\u200E"}};
  const std::string file = writeXML(value);
  EXPECT_TRUE(contains(file, "<key>&#127;</key>"));
  EXPECT_TRUE(contains(file, "<string>&#128;a&#8238;\u200E</string>"));
  EXPECT_EQ(readXML(file), value);
}

TEST(XMLWriting, RealsAreKeptBitForBit) {
  using Limits = std::numeric_limits<double>;
  for (const double real :
       {0.0, -0.0, 1.0, 0.1, 1.0 / 3, 1e300, -1e-300, Limits::max(), Limits::min(),
        Limits::denorm_min(), Limits::infinity(), -Limits::infinity(), Limits::quiet_NaN()}) {
    expectKept(real);
  }
}

TEST(XMLWriting, ANaNWithBitsOfItsOwnIsRefused) {
  const auto real = std::bit_cast<double>(std::uint64_t{0x7FF8000000000001});

  EXPECT_EQ(errorOfWritingXML(PropertyDictionary{{"r", real}}),
            "XML property list: cannot write a NaN with bits that XML does not keep at /r");
}

TEST(XMLWriting, WholeSecondsOfFourDigitYearsAreKept) {
  for (const double seconds : {0.0, 326'000'000.0, -63'145'526'400.0, 252'423'993'599.0}) {
    expectKept(PropertyDate{seconds});
  }
}

TEST(XMLWriting, DatesThatXMLWouldChangeAreRefused) {
  for (const double seconds :
       {0.5, -0.0, 1e-9, -63'145'526'401.0, 252'423'993'600.0, 1e300,
        std::numeric_limits<double>::infinity(), std::numeric_limits<double>::quiet_NaN()}) {
    EXPECT_EQ(errorOfWritingXML(PropertyDate{seconds}),
              "XML property list: cannot write a date that is not a whole second of the years 0 to "
              "9999 at /")
        << seconds;
  }
}

TEST(XMLWriting, DataOfEveryLengthIsKept) {
  std::string bytes;
  for (int length = 0; length < 10; ++length) {
    expectKept(PropertyData(bytes));
    bytes.push_back(static_cast<char>(0xFF - length));
  }
}

TEST(XMLWriting, TextsWithCharactersThatXMLForbidsAreRefused) {
  using namespace std::string_literals;
  for (const std::string& text : {"\0"s, "\x01"s, "\x0B"s, "\x1F"s, "\xEF\xBF\xBE"s,
                                  "\xEF\xBF\xBF"s, "\xED\xA0\x80"s, "\xFF"s, "\xC3"s}) {
    EXPECT_TRUE(contains(errorOfWritingXML(text), "a text with a character that XML cannot hold"));
    EXPECT_TRUE(contains(errorOfWritingXML(PropertyDictionary{{text, 1}}), "that XML cannot hold"));
  }
}

TEST(XMLWriting, CharactersBesideTheForbiddenOnesAreKept) {
  for (const char* text : {"\x7F", "\xC2\x80", "\xED\x9F\xBF", "\xEE\x80\x80", "\xEF\xBF\xBD",
                           "\xF0\x90\x80\x80", "\xF4\x8F\xBF\xBF"}) {
    expectKept(text);
  }
}

TEST(XMLWriting, AnErrorNamesThePlaceByKeysAndIndexes) {
  const PropertyValue value = PropertyDictionary{
      {"Accounts", PropertyArray{PropertyDictionary{}, PropertyDictionary{{"bad", "\x01"}}}}};

  EXPECT_TRUE(contains(errorOfWritingXML(value), " at /Accounts/1/bad"));
}

TEST(XMLWriting, ContainersAsDeepAsTheLimitAreKept) {
  expectKept(nestedArrays(kMaximumNestingDepth));
}

TEST(XMLWriting, ContainersDeeperThanTheLimitAreRefused) {
  EXPECT_TRUE(contains(errorOfWritingXML(nestedArrays(kMaximumNestingDepth + 1)),
                       "nested deeper than the limit"));
}

TEST(XMLWriting, MoreValuesThanTheLimitAreRefused) {
  const PropertyValue value =
      PropertyArray(std::vector<PropertyValue>(kMaximumExpandedValueCount, true));

  EXPECT_TRUE(contains(errorOfWritingXML(value), "more values than the limit"));
}

TEST(XMLWriting, ContainersAreIndentedDownToTheSixteenthLevel) {
  PropertyValue value = "innermost";
  for (int level = 0; level < 18; ++level) {
    value = PropertyArray{value};
  }

  const std::string file = writeXML(value);

  const auto line = [](std::size_t blanks, const std::string& content) {
    return "\n" + std::string(blanks, ' ') + content + "\n";
  };
  EXPECT_TRUE(contains(file, line(30, "<array>") + std::string(32, ' ') + "<array>\n" +
                                 std::string(32, ' ') + "<array>\n" + std::string(32, ' ') +
                                 "<string>innermost</string>\n"));
  EXPECT_FALSE(contains(file, std::string(33, ' ')));
}

TEST(XMLWriting, AnErrorOfTheOutermostValueNamesTheRoot) {
  EXPECT_EQ(errorOfWritingXML("\x01"),
            "XML property list: cannot write a text with a character that XML cannot hold at /");
}

TEST(XMLWriting, TheSignOfAValueThatIsNoNumberIsKept) {
  const double negative = std::copysign(std::numeric_limits<double>::quiet_NaN(), -1.0);

  EXPECT_TRUE(contains(writeXML(negative), "<real>-nan</real>"));
  EXPECT_TRUE(contains(writeXML(std::numeric_limits<double>::quiet_NaN()), "<real>nan</real>"));
  expectKept(negative);
  EXPECT_NE(PropertyValue(negative), PropertyValue(std::numeric_limits<double>::quiet_NaN()));
}

}  // namespace
}  // namespace accounts
