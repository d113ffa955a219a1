#include "propertylist/value/Description.h"

#include <gtest/gtest.h>

#include <string>

#include "tests/propertylist/PropertyListTesting.h"

namespace accounts {
namespace {

TEST(Description, AppendsToWhatTheLineHolds) {
  std::string line = "value: ";

  appendDescription(line, 5);

  EXPECT_EQ(line, "value: 5");
}

TEST(Description, ATextStandsAsItIs) {
  EXPECT_EQ(describe("He said \"caf\xC3\xA9\" \\o/ \xF0\x9F\x98\x80"),
            "He said \"caf\xC3\xA9\" \\o/ \xF0\x9F\x98\x80");
  EXPECT_EQ(describe(""), "");
}

TEST(Description, LineBreaksAndControlCharactersOfATextAreEscaped) {
  using namespace std::string_literals;
  EXPECT_EQ(describe("a\nb\rc\td"), "a\\nb\\rc\\td");
  EXPECT_EQ(describe("a\0b\x1B[31m\x7F"s), "a\\u0000b\\u001b[31m\\u007f");
}

TEST(Description, ControlCharactersAreEscapedUpToTheLastOfEachRange) {
  EXPECT_EQ(describe("\x1F\x20~\x7F"), "\\u001f ~\\u007f");
  EXPECT_EQ(describe("\xC2\x80\xC2\x9F\xC2\xA0"), "\\u0080\\u009f\xC2\xA0");
}

TEST(Description, LineBreaksBeyondASCIIAreEscapedToo) {
  EXPECT_EQ(describe("a\xC2\x85"
                     "b\xE2\x80\xA8"
                     "c\xE2\x80\xA9"),
            "a\\u0085b\\u2028c\\u2029");
}

TEST(Description, MarksThatReorderTheTextAfterThemAreEscaped) {
  EXPECT_EQ(describe("a\u202Ab\u202Ec\u2066d\u2069"), "a\\u202ab\\u202ec\\u2066d\\u2069");
  const char* const beside = "\u2027\u202F\u2065\u206A";
  EXPECT_EQ(describe(beside), beside);
}

TEST(Description, LettersAndSingleMarksOfADirectionStandAsTheyAre) {
  EXPECT_EQ(describe("\u05E9\u0628 Yahoo!\u200E"), "\u05E9\u0628 Yahoo!\u200E");
}

TEST(Description, JSONMeansTheSameWithoutThem) {
  EXPECT_EQ(escapedJSON("[\"a\x7F\u0080\u202E\u2069\u00E9\u05E9\u2026\xFF\"]"),
            "[\"a\\u007f\\u0080\\u202e\\u2069\u00E9\u05E9\u2026\xFF\"]");
  EXPECT_EQ(escapedJSON("[\"\\n\"]"), "[\"\\n\"]");
}

TEST(Description, JSONKeepsMalformedBytesOfWhatItIsMadeOf) {
  for (const std::string& json : {"[\"\xC2\"]", "[\"\xE2\x80\"]", "\xC2", "\xE2\x80"}) {
    EXPECT_EQ(escapedJSON(json), json);
  }
}

TEST(Description, AnUnpairedSurrogateIsEscaped) {
  EXPECT_EQ(describe("a\xED\xA0\xBD"
                     "b"),
            "a\\ud83db");
}

TEST(Description, BytesThatAreNoUTF8AreEscaped) {
  EXPECT_EQ(describe("a\xFF"
                     "b"),
            "a\\xffb");
  EXPECT_EQ(describe("\xC3"), "\\xc3");
  EXPECT_EQ(describe("\xC0\x80"), "\\xc0\\x80");
  EXPECT_EQ(describe("\xE0\x80\x80"), "\\xe0\\x80\\x80");
  EXPECT_EQ(describe("\xF4\x90\x80\x80"), "\\xf4\\x90\\x80\\x80");
  EXPECT_EQ(describe("\xE2\x82"), "\\xe2\\x82");
}

TEST(Description, IntegersAndBooleansAreJSON) {
  EXPECT_EQ(describe(-12), "-12");
  EXPECT_EQ(describe(std::numeric_limits<std::uint64_t>::max()), "18446744073709551615");
  EXPECT_EQ(describe(std::numeric_limits<std::int64_t>::min()), "-9223372036854775808");
  EXPECT_EQ(describe(true), "true");
  EXPECT_EQ(describe(false), "false");
}

TEST(Description, ARealNeverLooksLikeAnInteger) {
  EXPECT_EQ(describe(1.0), "1.0");
  EXPECT_EQ(describe(-0.0), "-0.0");
  EXPECT_EQ(describe(0.1), "0.1");
  EXPECT_EQ(describe(1e300), "1e+300");
}

TEST(Description, RealsThatJSONDoesNotHaveAreNamed) {
  EXPECT_EQ(describe(kNaN), "\"NaN\"");
  EXPECT_EQ(describe(kInfinity), "\"Infinity\"");
  EXPECT_EQ(describe(-kInfinity), "\"-Infinity\"");
}

TEST(Description, DatesAreISO8601) {
  EXPECT_EQ(describe(PropertyDate{0}), "\"2001-01-01T00:00:00Z\"");
  EXPECT_EQ(describe(PropertyDate{326'046'896}), "\"2011-05-02T16:34:56Z\"");
  EXPECT_EQ(describe(PropertyDate{-1}), "\"2000-12-31T23:59:59Z\"");
  EXPECT_EQ(describe(PropertyDate{0.25}), "\"2001-01-01T00:00:00.25Z\"");
  EXPECT_EQ(describe(PropertyDate{-0.5}), "\"2000-12-31T23:59:59.5Z\"");
  EXPECT_EQ(describe(PropertyDate{0.99999999}), "\"2001-01-01T00:00:01Z\"");
}

TEST(Description, TheCalendarReachesFromTheYear0ToTheYear9999) {
  EXPECT_EQ(describe(PropertyDate{252'423'993'599}), "\"9999-12-31T23:59:59Z\"");
  EXPECT_EQ(describe(PropertyDate{252'423'993'600}), "\"date 252423993600\"");
  EXPECT_EQ(describe(PropertyDate{-63'145'526'400}), "\"0000-01-01T00:00:00Z\"");
  EXPECT_EQ(describe(PropertyDate{-63'145'526'401}), "\"date -63145526401\"");
}

TEST(Description, DatesBeyondTheCalendarAreReadableToo) {
  EXPECT_EQ(describe(PropertyDate{kNaN}), "\"date NaN\"");
  EXPECT_EQ(describe(PropertyDate{kInfinity}), "\"date Infinity\"");
  EXPECT_EQ(describe(PropertyDate{-kInfinity}), "\"date -Infinity\"");
  EXPECT_EQ(describe(PropertyDate{1e300}), "\"date 1e+300\"");
}

TEST(Description, DataIsHexadecimal) {
  using namespace std::string_literals;
  EXPECT_EQ(describe(PropertyData("\x00\x0F\xFF"s)), "\"<000fff>\"");
  EXPECT_EQ(describe(PropertyData()), "\"<>\"");
}

TEST(Description, ContainersAreCompactJSONWithSortedKeys) {
  const PropertyDictionary dictionary{{"b", PropertyArray{1, "two", PropertyArray{}}},
                                      {"a", PropertyDictionary{{"x", PropertyDictionary{}}}}};

  EXPECT_EQ(describe(dictionary), R"({"a":{"x":{}},"b":[1,"two",[]]})");
}

TEST(Description, TextsAndKeysInContainersAreJSONStrings) {
  EXPECT_EQ(describe(PropertyDictionary{{"k\"\n", "back\\slash \"quoted\"\x01"}}),
            R"({"k\"\n":"back\\slash \"quoted\"\u0001"})");
}

TEST(EscapedText, IsTheDescriptionOfAText) {
  std::string line;

  appendEscapedText(line, "two\nlines \"quoted\"");

  EXPECT_EQ(line, "two\\nlines \"quoted\"");
}

}  // namespace
}  // namespace accounts
