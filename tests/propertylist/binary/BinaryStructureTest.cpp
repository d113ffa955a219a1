#include <gtest/gtest.h>

#include <limits>
#include <string>

#include "propertylist/PropertyListLimits.h"
#include "tests/propertylist/PropertyListTesting.h"

namespace accounts {
namespace {

using namespace std::string_literals;

constexpr std::uint64_t kHuge = std::numeric_limits<std::uint64_t>::max();
constexpr char kDictionaryOfTwo = '\xD2';

/// A file with one empty text, its trailer's eight-byte number at a position replaced.
std::string withTrailerNumber(std::size_t position, std::uint64_t number) {
  std::string file = fileWithObject("\x50");
  std::string bytes;
  BinaryFile::appendNumber(bytes, number, 8);
  return file.replace(file.size() - 32 + position, 8, bytes);
}

TEST(BinaryStructure, ReferencesAndOffsetsMayHaveAnySizeUpToEight) {
  for (std::size_t size = 1; size <= 8; ++size) {
    BinaryFile file;
    file.add("\x51x");
    std::string array(1, kArrayOfOne);
    BinaryFile::appendNumber(array, 0, size);
    file.add(array);
    file.setReferenceSize(size);
    file.setOffsetSize(size);

    EXPECT_EQ(readBinary(file.build()), PropertyValue(PropertyArray{"x"})) << size;
  }
}

TEST(BinaryStructure, ReferencesOrOffsetsOfNoByteOrMoreThanEightAreRefused) {
  for (const std::size_t size : {0U, 9U, 255U}) {
    BinaryFile references;
    references.add("\x50");
    references.setReferenceSize(size);
    EXPECT_TRUE(contains(errorOfReadingBinary(references.build()), "not of 1 to 8 bytes"));

    std::string offsets = fileWithObject("\x50");
    offsets[offsets.size() - 26] = static_cast<char>(size);
    EXPECT_TRUE(contains(errorOfReadingBinary(offsets), "not of 1 to 8 bytes"));
  }
}

TEST(BinaryStructure, AnotherSignatureOrVersionIsRefused) {
  std::string file = fileWithObject("\x50");
  file[7] = '1';

  EXPECT_TRUE(isBinaryPropertyList(file));
  EXPECT_TRUE(contains(errorOfReadingBinary(file), "no \"bplist00\" at byte offset 0"));
  EXPECT_FALSE(isBinaryPropertyList("<?xml"));
  EXPECT_FALSE(isBinaryPropertyList("bplis"));
}

TEST(BinaryStructure, AFileTooShortForItsTrailerIsRefused) {
  EXPECT_TRUE(contains(errorOfReadingBinary("bplist00"), "too short for its trailer"));
  EXPECT_TRUE(contains(errorOfReadingBinary("bplist00" + std::string(31, '\0')), "too short"));
}

TEST(BinaryStructure, ATrailerWithoutObjectsIsRefused) {
  EXPECT_TRUE(contains(errorOfReadingBinary(withTrailerNumber(8, 0)), "top object does not exist"));
}

TEST(BinaryStructure, ATopObjectThatDoesNotExistIsRefused) {
  EXPECT_TRUE(contains(errorOfReadingBinary(withTrailerNumber(16, 1)), "does not exist"));
  EXPECT_TRUE(contains(errorOfReadingBinary(withTrailerNumber(16, kHuge)), "does not exist"));
}

TEST(BinaryStructure, AnObjectCountThatTheTableHasNoRoomForIsRefused) {
  EXPECT_TRUE(contains(errorOfReadingBinary(withTrailerNumber(8, 2)), "table lies beyond"));
  EXPECT_TRUE(contains(errorOfReadingBinary(withTrailerNumber(8, kMaximumObjectCount)),
                       "table lies beyond"));
}

TEST(BinaryStructure, MoreObjectsThanTheLimitAreRefused) {
  EXPECT_TRUE(contains(errorOfReadingBinary(withTrailerNumber(8, kMaximumObjectCount + 1)),
                       "more objects than the limit"));
  EXPECT_TRUE(contains(errorOfReadingBinary(withTrailerNumber(8, kHuge)), "more objects"));
  // Eight times this count wraps round to 8.
  EXPECT_TRUE(contains(errorOfReadingBinary(withTrailerNumber(8, (std::uint64_t{1} << 61) + 1)),
                       "more objects"));
}

TEST(BinaryStructure, AnOffsetTableBeyondTheFileIsRefused) {
  for (const std::uint64_t table : {std::uint64_t{0}, std::uint64_t{7}, std::uint64_t{10},
                                    std::uint64_t{1000}, kHuge, kHuge - 7}) {
    EXPECT_TRUE(contains(errorOfReadingBinary(withTrailerNumber(24, table)), "table lies beyond"))
        << table;
  }
}

TEST(BinaryStructure, AnOffsetOutsideTheObjectsIsRefused) {
  for (const std::uint64_t offset :
       {std::uint64_t{0}, std::uint64_t{7}, std::uint64_t{9}, std::uint64_t{1000}, kHuge}) {
    BinaryFile file;
    file.add("\x50");
    file.setOffset(0, offset);

    EXPECT_TRUE(contains(errorOfReadingBinary(file.build()),
                         "an offset that lies outside the objects at byte offset 9"))
        << offset;
  }
}

TEST(BinaryStructure, AReferenceToAnObjectThatDoesNotExistIsRefused) {
  BinaryFile file;
  file.addContainer(kArrayOfOne, {1});
  EXPECT_TRUE(contains(errorOfReadingBinary(file.build()),
                       "an object that does not exist at byte offset 9"));

  BinaryFile huge;
  huge.add(kArrayOfOne + std::string(8, '\xFF'));
  huge.setReferenceSize(8);
  EXPECT_TRUE(contains(errorOfReadingBinary(huge.build()), "an object that does not exist"));
}

TEST(BinaryStructure, ALengthBeyondTheObjectsIsRefusedAlsoWhenItOverflows) {
  for (const char* marker : {"\x4F", "\x5F", "\x6F", "\xAF", "\xDF"}) {
    for (const std::uint64_t length :
         {std::uint64_t{1000}, kHuge, kHuge / 2 + 1, kHuge / 2 + 2, kHuge / 4 + 1}) {
      std::string object = marker + "\x13"s;
      BinaryFile::appendNumber(object, length, 8);

      EXPECT_TRUE(contains(errorOfReadingBinary(fileWithObject(object)),
                           "ends beyond the objects at byte offset 8"))
          << length;
    }
  }
}

TEST(BinaryStructure, AnObjectThatReachesIntoTheTableIsRefused) {
  for (const char* object : {"\x41", "\x51", "\x61x", "\x10", "\x22xxx", "\x33xxxxxxx", "\xA1",
                             "\xD1x", "\x5F", "\x5F\x11x"}) {
    errorOfReadingBinary(fileWithObject(object));
  }
}

TEST(BinaryStructure, ObjectsThatNothingRefersToAreNotLookedAt) {
  BinaryFile file;
  file.add("\x80");
  file.add("\x51x");

  EXPECT_EQ(readBinary(file.build()), PropertyValue("x"));
}

TEST(BinaryStructure, AnObjectReferredToTwiceIsSharedInMemory) {
  BinaryFile file;
  const std::size_t text = file.add("\x51x");
  const std::size_t inner = file.addContainer(kArrayOfOne, {text});
  file.addContainer(kArrayOfTwo, {inner, inner});

  const PropertyValue value = readBinary(file.build());

  ASSERT_EQ(value, PropertyValue(PropertyArray{PropertyArray{"x"}, PropertyArray{"x"}}));
  EXPECT_TRUE(value.asArray()->at(0).asArray()->isSameAs(*value.asArray()->at(1).asArray()));
}

TEST(BinaryStructure, DictionariesMayStandInAnyKeyOrder) {
  BinaryFile file;
  const std::size_t b = file.add(
      "\x51"
      "b");
  const std::size_t a = file.add(
      "\x51"
      "a");
  file.addContainer(kDictionaryOfTwo, {b, a, a, b});

  EXPECT_EQ(readBinary(file.build()), PropertyValue(PropertyDictionary{{"a", "b"}, {"b", "a"}}));
}

TEST(BinaryStructure, OfTheSameKeyTwiceTheLastOneHolds) {
  BinaryFile file;
  const std::size_t key = file.add("\x51k");
  const std::size_t first = file.add("\x10\x01");
  const std::size_t last = file.add("\x10\x02");
  file.addContainer(kDictionaryOfTwo, {key, key, first, last});

  EXPECT_EQ(readBinary(file.build()), PropertyValue(PropertyDictionary{{"k", 2}}));
}

TEST(BinaryStructure, OneTextMayBeAKeyAndItsOwnValue) {
  BinaryFile file;
  const std::size_t text = file.add("\x51x");
  file.addContainer(kDictionaryOfOne, {text, text});

  EXPECT_EQ(readBinary(file.build()), PropertyValue(PropertyDictionary{{"x", "x"}}));
}

TEST(BinaryStructure, ATextFirstMetAsAValueMayBeAKeyLater) {
  BinaryFile file;
  const std::size_t text = file.add("\x51x");
  const std::size_t inner = file.addContainer(kDictionaryOfOne, {text, text});
  file.addContainer(kArrayOfTwo, {text, inner});

  EXPECT_EQ(readBinary(file.build()),
            PropertyValue(PropertyArray{"x", PropertyDictionary{{"x", "x"}}}));
}

TEST(BinaryStructure, AValueMadeInADictionaryOutOfOrderIsSharedWithOthers) {
  BinaryFile file;
  const std::size_t b = file.add(
      "\x51"
      "b");
  const std::size_t a = file.add(
      "\x51"
      "a");
  const std::size_t inner = file.addContainer(kArrayOfOne, {a});
  const std::size_t unordered = file.addContainer(kDictionaryOfTwo, {b, a, inner, b});
  file.addContainer(kArrayOfTwo, {unordered, inner});

  EXPECT_EQ(readBinary(file.build()),
            PropertyValue(PropertyArray{PropertyDictionary{{"a", "b"}, {"b", PropertyArray{"a"}}},
                                        PropertyArray{"a"}}));
}

TEST(BinaryStructure, DictionariesThatListTheSameKeysShareThemInMemory) {
  for (const bool isOrdered : {true, false}) {
    BinaryFile file;
    const std::size_t first = file.add(isOrdered ? "\x51x" : "\x51y");
    const std::size_t second = file.add(isOrdered ? "\x51y" : "\x51x");
    const std::size_t one = file.addContainer(kDictionaryOfTwo, {first, second, first, second});
    const std::size_t other = file.addContainer(kDictionaryOfTwo, {first, second, second, first});
    file.addContainer(kArrayOfTwo, {one, other});

    const PropertyValue value = readBinary(file.build());

    const PropertyDictionary& left = *value.asArray()->at(0).asDictionary();
    const PropertyDictionary& right = *value.asArray()->at(1).asDictionary();
    EXPECT_EQ(left, (PropertyDictionary{{"x", "x"}, {"y", "y"}}));
    EXPECT_EQ(right, (PropertyDictionary{{"x", "y"}, {"y", "x"}}));
    EXPECT_TRUE(left.keys().isSameAs(right.keys()));
  }
}

TEST(BinaryStructure, AKeyThatIsNoTextIsRefused) {
  for (const char* key : {"\x10\x01", "\x09", "\x41x", "\xA0", "\xD0"}) {
    BinaryFile file;
    const std::size_t notText = file.add(key);
    file.addContainer(kDictionaryOfOne, {notText, notText});

    EXPECT_TRUE(contains(errorOfReadingBinary(file.build()), "a key that is no text"));
  }
}

TEST(BinaryStructure, AKeyThatIsNotASCIIIsRead) {
  BinaryFile file;
  const std::size_t key = file.add(std::string_view("\x62\x00\xFC\x20\xAC", 5));
  const std::size_t value = file.add("\x09");
  file.addContainer(kDictionaryOfOne, {key, value});

  EXPECT_EQ(readBinary(file.build()),
            PropertyValue(PropertyDictionary{{"\xC3\xBC\xE2\x82\xAC", true}}));
}

TEST(BinaryStructure, AKeyThatIsNotASCIIIsWrittenAndReadAgain) {
  const PropertyValue value = PropertyDictionary{
      {"B\xC3\xBCro", 1}, {"a", 2}, {"\xF0\x9F\x98\x80", PropertyDictionary{{"\xC3\xBC", 3}}}};

  EXPECT_EQ(readBinary(writeBinary(value)), value);
}

}  // namespace
}  // namespace accounts
