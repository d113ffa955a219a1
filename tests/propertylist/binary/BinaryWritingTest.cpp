#include <gtest/gtest.h>

#include <bit>
#include <limits>
#include <string>

#include "propertylist/PropertyListLimits.h"
#include "tests/propertylist/PropertyListTesting.h"

namespace accounts {
namespace {

using namespace std::string_literals;

std::string errorOfWriting(const PropertyValue& value) {
  const auto bytes = writeBinaryPropertyList(value);
  EXPECT_FALSE(bytes);
  return bytes ? "" : bytes.error().text;
}

TEST(BinaryWriting, AFileIsLaidOutAsTheFormatSays) {
  EXPECT_EQ(writeBinary(PropertyDictionary{{"k", PropertyArray{true}}}),
            "bplist00"
            "\x51k"             // 2: at 8
            "\x09"              // 3: at 10
            "\xD1\x02\x01"      // 0: at 11
            "\xA1\x03"          // 1: at 14
            "\x0B\x0E\x08\x0A"  // the table, at 16
            "\0\0\0\0\0\0\x01\x01"
            "\0\0\0\0\0\0\0\x04"
            "\0\0\0\0\0\0\0\0"
            "\0\0\0\0\0\0\0\x10"s);
}

TEST(BinaryWriting, EveryKindIsReadBackAsItWas) {
  const PropertyValue value = valueOfEveryKind();

  const PropertyValue once = readBinary(writeBinary(value));
  const PropertyValue twice = readBinary(writeBinary(once));

  EXPECT_EQ(once, value);
  EXPECT_EQ(twice, value);
}

TEST(BinaryWriting, ReadingAndWritingAgainGivesTheSameBytes) {
  const std::string file = writeBinary(valueOfEveryKind());

  EXPECT_TRUE(writeBinary(readBinary(file)) == file);
}

TEST(BinaryWriting, TheSameValueGivesTheSameBytesWhateverSharesMemory) {
  const PropertyDictionary child{{"a", 1}, {"b", "text"}};
  const PropertyValue shared = PropertyArray{child, child};
  const PropertyValue apart = PropertyArray{PropertyDictionary{{"b", "text"}, {"a", 1}},
                                            PropertyDictionary{{"a", 1}, {"b", "text"}}};

  EXPECT_TRUE(writeBinary(shared) == writeBinary(apart));
}

TEST(BinaryWriting, EqualScalarsAreWrittenOnce) {
  EXPECT_EQ(objectCount(writeBinary(PropertyArray{"x", "x", Text("x")})), 2U);
  EXPECT_EQ(objectCount(writeBinary(PropertyDictionary{{"x", "x"}})), 2U);
  EXPECT_EQ(objectCount(writeBinary(PropertyArray{1, 1, 1})), 2U);
  EXPECT_EQ(objectCount(writeBinary(PropertyArray{true, true, false})), 3U);
  EXPECT_EQ(objectCount(writeBinary(PropertyArray{PropertyData("x"), PropertyData("x")})), 2U);
  EXPECT_EQ(objectCount(writeBinary(PropertyArray{PropertyDate{1}, PropertyDate{1}})), 2U);
}

TEST(BinaryWriting, ScalarsOfDifferentKindsAreNeverMerged) {
  const PropertyValue values[] = {
      PropertyArray{true, 1, 1.0, PropertyDate{1.0}},
      PropertyArray{false, 0, 0.0, PropertyDate{0.0}, "", PropertyData()},
      PropertyArray{"x", PropertyData("x")},
      PropertyArray{0.0, -0.0},
      PropertyArray{PropertyDate{0.0}, PropertyDate{-0.0}},
      PropertyArray{PropertyArray{}, PropertyDictionary{}},
      PropertyArray{std::numeric_limits<std::int64_t>::min(), std::uint64_t{1} << 63},
      PropertyArray{std::numeric_limits<double>::quiet_NaN(), std::bit_cast<double>(~0ULL)}};
  for (const PropertyValue& value : values) {
    EXPECT_EQ(objectCount(writeBinary(value)), value.asArray()->size() + 1);
    EXPECT_EQ(readBinary(writeBinary(value)), value);
  }
}

TEST(BinaryWriting, AnArrayAndADictionaryWithTheSameReferencesAreNotMerged) {
  const PropertyValue value =
      PropertyArray{PropertyArray{"k", "v"}, PropertyDictionary{{"k", "v"}}};

  EXPECT_EQ(readBinary(writeBinary(value)), value);
}

TEST(BinaryWriting, AValueReachedTwiceIsWrittenOnce) {
  PropertyValue value = "leaf";
  for (int level = 0; level < 12; ++level) {
    value = PropertyArray{value, value};
  }

  EXPECT_EQ(objectCount(writeBinary(value)), 13U);
}

TEST(BinaryWriting, AScalarMayStandAlone) {
  for (const PropertyValue& value :
       {PropertyValue("x"), PropertyValue(5), PropertyValue(true), PropertyValue(0.5)}) {
    EXPECT_EQ(readBinary(writeBinary(value)), value);
    EXPECT_EQ(objectCount(writeBinary(value)), 1U);
  }
}

TEST(BinaryWriting, ReferencesAndOffsetsAreAsSmallAsTheObjectsAllow) {
  const auto sizes = [](int elementCount) {
    PropertyArray array;
    for (int index = 0; index < elementCount; ++index) {
      array.append(index);
    }
    const std::string file = writeBinary(array);
    EXPECT_EQ(readBinary(file), PropertyValue(array));
    return std::pair(trailerNumber(file, 6, 1), trailerNumber(file, 7, 1));
  };

  EXPECT_EQ(sizes(20), std::pair(std::uint64_t{1}, std::uint64_t{1}));
  EXPECT_EQ(sizes(254), std::pair(std::uint64_t{2}, std::uint64_t{1}));
  EXPECT_EQ(sizes(255), std::pair(std::uint64_t{2}, std::uint64_t{2}));
  EXPECT_EQ(sizes(66'000), std::pair(std::uint64_t{4}, std::uint64_t{4}));
}

TEST(BinaryWriting, AnOffsetHasRoomForTheTablesOwnToo) {
  // A text of this length has a head of four bytes behind the header of eight.
  const auto offsetSizeWithTableAt = [](std::size_t offset) {
    const std::string file = writeBinary(std::string(offset - 12 + 1, 'x'));
    EXPECT_EQ(trailerNumber(file, 24, 8), offset);
    return trailerNumber(file, 6, 1);
  };

  EXPECT_EQ(offsetSizeWithTableAt(255), 1U);
  EXPECT_EQ(offsetSizeWithTableAt(256), 2U);
}

TEST(BinaryWriting, ATextIsASCIIIfItCanBeAndUTF16Otherwise) {
  EXPECT_EQ(writeBinary("ab\0"s).substr(8, 4),
            "\x53"
            "ab\0"s);
  EXPECT_EQ(writeBinary("\xC3\xBC").substr(8, 3), "\x61\0\xFC"s);
  EXPECT_EQ(writeBinary("\xF0\x9F\x98\x80").substr(8, 5), "\x62\xD8\x3D\xDE\0"s);
}

TEST(BinaryWriting, ATextThatIsNoUTF8IsRefused) {
  for (const char* text :
       {"\xFF", "a\xC3", "\xC0\x80", "\xE0\x80\x80", "\xF4\x90\x80\x80", "\x80"}) {
    EXPECT_TRUE(contains(errorOfWriting(text), "not well-formed UTF-8"));
    EXPECT_TRUE(contains(errorOfWriting(PropertyDictionary{{text, 1}}), "not well-formed UTF-8"));
  }
}

TEST(BinaryWriting, AValueAsDeepAsTheLimitIsWritten) {
  const PropertyValue value = nestedArrays(kMaximumNestingDepth);

  EXPECT_EQ(readBinary(writeBinary(value)), value);
}

TEST(BinaryWriting, AValueDeeperThanTheLimitIsRefused) {
  EXPECT_TRUE(contains(errorOfWriting(nestedArrays(kMaximumNestingDepth + 1)),
                       "nested deeper than the limit"));
}

TEST(BinaryWriting, ASharedChildCountsWithItsWholeHeightWhereverItStands) {
  const PropertyValue lower = nestedArrays(kMaximumNestingDepth - 1);

  EXPECT_EQ(readBinary(writeBinary(PropertyArray{lower, lower})),
            PropertyValue(PropertyArray{lower, lower}));
  EXPECT_TRUE(contains(errorOfWriting(PropertyArray{lower, PropertyArray{lower}}),
                       "nested deeper than the limit"));
}

TEST(BinaryWriting, AValueThatStandsForTooManyValuesIsRefused) {
  PropertyValue value = PropertyArray{};
  for (int level = 0; level < 40; ++level) {
    value = PropertyArray{value, value};
  }

  EXPECT_TRUE(contains(errorOfWriting(value), "more values than the limit"));
}

TEST(BinaryWriting, ATextThatIsNotWellFormedIsRefusedAsAKeyToo) {
  EXPECT_TRUE(contains(errorOfWriting(PropertyDictionary{{"\xC0", 1}}), "well-formed UTF-8"));
}

TEST(BinaryWriting, ATextThatIsNotWellFormedIsRefusedUnderAKeyToo) {
  EXPECT_TRUE(contains(errorOfWriting(PropertyDictionary{{"k", "\xC0"}}), "well-formed UTF-8"));
}

}  // namespace
}  // namespace accounts
