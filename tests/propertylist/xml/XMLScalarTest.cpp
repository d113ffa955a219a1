#include <gtest/gtest.h>

#include <limits>
#include <string>

#include "tests/propertylist/PropertyListTesting.h"

namespace accounts {
namespace {

std::string element(std::string_view name, std::string_view content) {
  return "<" + std::string(name) + ">" + std::string(content) + "</" + std::string(name) + ">";
}

PropertyValue read(std::string_view name, std::string_view content) {
  return readXML(inPropertyList(element(name, content)));
}

void expectRefused(std::string_view name, std::string_view content) {
  const std::string error = errorOfReadingXML(inPropertyList(element(name, content)));
  EXPECT_TRUE(contains(error, "does not fit its element <" + std::string(name) + "> in line 2"))
      << content;
}

TEST(XMLScalars, Integers) {
  EXPECT_EQ(read("integer", "12"), PropertyValue(12));
  EXPECT_EQ(read("integer", "-12"), PropertyValue(-12));
  EXPECT_EQ(read("integer", "+12"), PropertyValue(12));
  EXPECT_EQ(read("integer", "007"), PropertyValue(7));
  EXPECT_EQ(read("integer", "-0"), PropertyValue(0));
  EXPECT_EQ(read("integer", "\n\t12 "), PropertyValue(12));
  EXPECT_EQ(read("integer", "&#13;12&#13;"), PropertyValue(12));
}

TEST(XMLScalars, HexadecimalIntegers) {
  EXPECT_EQ(read("integer", "0x1F"), PropertyValue(31));
  EXPECT_EQ(read("integer", "0Xff"), PropertyValue(255));
  EXPECT_EQ(read("integer", "-0x10"), PropertyValue(-16));
  EXPECT_EQ(read("integer", "0xFFFFFFFFFFFFFFFF"),
            PropertyValue(std::numeric_limits<std::uint64_t>::max()));
}

TEST(XMLScalars, IntegersUpToTheEndsOfTheRangeAreRead) {
  EXPECT_EQ(read("integer", "18446744073709551615"),
            PropertyValue(std::numeric_limits<std::uint64_t>::max()));
  EXPECT_EQ(read("integer", "-9223372036854775808"),
            PropertyValue(std::numeric_limits<std::int64_t>::min()));
}

TEST(XMLScalars, IntegersBeyondTheRangeAreRefused) {
  expectRefused("integer", "18446744073709551616");
  expectRefused("integer", "-9223372036854775809");
  expectRefused("integer", "0x10000000000000000");
}

TEST(XMLScalars, AnythingElseInAnIntegerIsRefused) {
  for (const char* content :
       {"", " ", "-", "0x", "12a", "a", "1 2", "1.0", "--1", "+-1", "0x-1", "1e3", "0xG", "nan"}) {
    expectRefused("integer", content);
  }
}

TEST(XMLScalars, Reals) {
  EXPECT_EQ(read("real", "1.5"), PropertyValue(1.5));
  EXPECT_EQ(read("real", "-1.5e-3"), PropertyValue(-1.5e-3));
  EXPECT_EQ(read("real", "+2"), PropertyValue(2.0));
  EXPECT_EQ(read("real", ".5"), PropertyValue(0.5));
  EXPECT_EQ(read("real", " 1E3\n"), PropertyValue(1000.0));
  EXPECT_EQ(read("real", "-0"), PropertyValue(-0.0));
  EXPECT_EQ(read("real", "0.1"), PropertyValue(0.1));
}

TEST(XMLScalars, RealsThatAreNoNumbersHaveNames) {
  for (const char* name : {"inf", "+inf", "Infinity", "+INFINITY"}) {
    EXPECT_EQ(read("real", name), PropertyValue(kInfinity)) << name;
  }
  for (const char* name : {"-inf", "-infinity"}) {
    EXPECT_EQ(read("real", name), PropertyValue(-kInfinity)) << name;
  }
  EXPECT_EQ(read("real", "nan"), PropertyValue(kNaN));
  EXPECT_EQ(read("real", "NaN"), PropertyValue(kNaN));
}

TEST(XMLScalars, AnythingElseInARealIsRefused) {
  for (const char* content : {"", "-", ".", "1.5x", "1,5", "1.5.5", "0x1p3", "infinit", "nano",
                              "nan(1)", "--1", "+-1", "-+inf", "1e", "1e999"}) {
    expectRefused("real", content);
  }
}

TEST(XMLScalars, Dates) {
  EXPECT_EQ(read("date", "2001-01-01T00:00:00Z"), PropertyValue(PropertyDate{0}));
  EXPECT_EQ(read("date", " 2011-05-02T16:34:56Z\n"), PropertyValue(PropertyDate{326'046'896}));
  EXPECT_EQ(read("date", "2000-02-29T00:00:00Z"), PropertyValue(PropertyDate{-26'524'800}));
  EXPECT_EQ(read("date", "0001-01-01T00:00:00Z"), PropertyValue(PropertyDate{-63'113'904'000}));
}

TEST(XMLScalars, AnythingElseInADateIsRefused) {
  for (const char* content :
       {"", "2001-01-01", "2001-01-01T00:00:00", "2001-01-01T00:00:00+00:00",
        "2001-01-01 00:00:00Z", "2001-01-01T00:00:00.5Z", "2001-1-1T00:00:00Z",
        "20010-01-01T00:00:00Z", "2001-13-01T00:00:00Z", "2001-00-01T00:00:00Z",
        "2001-02-29T00:00:00Z", "2001-01-00T00:00:00Z", "2001-04-31T00:00:00Z",
        "2001-01-01T24:00:00Z", "2001-01-01T00:60:00Z", "2001-01-01T00:00:60Z",
        "2001-01-01T00:00:00Zx", "-001-01-01T00:00:00Z"}) {
    expectRefused("date", content);
  }
}

TEST(XMLScalars, DataIsBase64WithBlanksAnywhere) {
  using namespace std::string_literals;
  EXPECT_EQ(read("data", ""), PropertyValue(PropertyData()));
  EXPECT_EQ(read("data", "AP/+"), PropertyValue(PropertyData("\x00\xFF\xFE"s)));
  EXPECT_EQ(read("data", "QQ=="), PropertyValue(PropertyData("A")));
  EXPECT_EQ(read("data", "QUI="), PropertyValue(PropertyData("AB")));
  EXPECT_EQ(read("data", "\n\tQU JD\n\tRA = =\n"), PropertyValue(PropertyData("ABCD")));
}

TEST(XMLScalars, AnythingElseInDataIsRefused) {
  for (const char* content : {"Q", "Q===", "QUJDQ===", "QQ", "QQ=", "QQ===", "QUI", "QUI==", "=",
                              "====", "QUJD=", "QQ==QQ==", "QU*D", "QU-_", "Q=Q="}) {
    expectRefused("data", content);
  }
}

TEST(XMLScalars, ATextIsKeptWithItsBlanks) {
  EXPECT_EQ(read("string", " a\n\tb "), PropertyValue(" a\n\tb "));
  EXPECT_EQ(read("string", ""), PropertyValue(""));
  EXPECT_EQ(read("string", "B\xC3\xBCro \xF0\x9F\x98\x80"),
            PropertyValue("B\xC3\xBCro \xF0\x9F\x98\x80"));
}

TEST(XMLScalars, XMLsOwnEntitiesAndCharacterReferencesAreResolved) {
  EXPECT_EQ(read("string", "&lt;&gt;&amp;&quot;&apos;"), PropertyValue("<>&\"'"));
  EXPECT_EQ(read("string", "&#65;&#x20AC;"), PropertyValue("A\xE2\x82\xAC"));
}

TEST(XMLScalars, CommentsAndLiteralSectionsWithinATextLeaveTheTextWhole) {
  EXPECT_EQ(read("string", "a<!-- no -->b<![CDATA[<&>]]>c<?no?>"), PropertyValue("ab<&>c"));
}

TEST(XMLScalars, ALongTextIsKeptWhole) {
  const std::string text(200'000, 'x');

  EXPECT_EQ(read("string", text), PropertyValue(text));
}

TEST(XMLScalars, BooleansHoldNothing) {
  EXPECT_EQ(readXML(inPropertyList("<true/>")), PropertyValue(true));
  EXPECT_EQ(readXML(inPropertyList("<false></false>")), PropertyValue(false));
  expectRefused("true", "yes");
}

}  // namespace
}  // namespace accounts
