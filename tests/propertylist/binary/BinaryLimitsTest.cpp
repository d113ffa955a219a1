#include <gtest/gtest.h>

#include <functional>
#include <string>
#include <vector>

#include "propertylist/PropertyListLimits.h"
#include "tests/propertylist/PropertyListTesting.h"

// Each limit of the reader at its bound: the last file that it accepts and the first that it
// refuses.

namespace accounts {
namespace {

/// Adds arrays of two, each twice in the next, and returns the number of the last. It stands for
/// 2^depth - 1 values, few of them containers.
std::size_t addDoublingArrays(BinaryFile& file, std::size_t depth) {
  constexpr std::size_t kDepthOfFifteenValues = 4;
  std::size_t array =
      file.addContainer(kArrayOfFourteen, std::vector<std::size_t>(14, file.add("\x08")));
  for (std::size_t level = kDepthOfFifteenValues; level < depth; ++level) {
    array = file.addContainer(kArrayOfTwo, {array, array});
  }
  return array;
}

constexpr std::size_t kFileSize = std::size_t{1} << 13;
constexpr std::size_t kDepthOfNearlyAllValues = 14;
static_assert(maximumExpandedValueCount(kFileSize) == std::uint64_t{1} << kDepthOfNearlyAllValues);

/// A file of `kFileSize` bytes with these objects, the last of them at the top.
std::string fileWith(const std::function<void(BinaryFile&)>& addObjects) {
  const auto withUnusedBytes = [&](std::size_t count) {
    BinaryFile file;
    file.add(std::string(count, 'u'));
    addObjects(file);
    return file.build();
  };
  return withUnusedBytes(kFileSize - withUnusedBytes(0).size());
}

constexpr const char* kTooManyValues =
    "a container that stands for more values than a file of this size may";

TEST(BinaryLimits, AContainerMayStandForAsManyValuesAsTheLimit) {
  const std::string file = fileWith([](BinaryFile& made) {
    made.addContainer(kArrayOfOne, {addDoublingArrays(made, kDepthOfNearlyAllValues)});
  });

  EXPECT_EQ(file.size(), kFileSize);
  EXPECT_EQ(readBinary(file).kind(), PropertyKind::Array);
}

TEST(BinaryLimits, OneValueMoreThanTheLimitIsRefused) {
  const std::string file = fileWith([](BinaryFile& made) {
    const std::size_t scalar = made.add("\x08");
    made.addContainer(kArrayOfTwo, {addDoublingArrays(made, kDepthOfNearlyAllValues), scalar});
  });

  EXPECT_TRUE(contains(errorOfReadingBinary(file), kTooManyValues));
}

TEST(BinaryLimits, AScalarCountsOnce) {
  const auto fileOf = [](std::string_view scalar, bool isOneTooMany) {
    return fileWith([&](BinaryFile& file) {
      const std::size_t child = file.add(scalar);
      // Twice half of the limit less one, and the array: room for one more.
      const std::size_t half = addDoublingArrays(file, kDepthOfNearlyAllValues - 1);
      if (isOneTooMany) {
        file.addContainer('\xA4', {half, half, child, child});
      } else {
        file.addContainer('\xA3', {half, half, child});
      }
    });
  };
  for (const std::string_view scalar : {"\x09", "\x10\x07", "\x41z", "\x51z"}) {
    EXPECT_EQ(readBinary(fileOf(scalar, false)).kind(), PropertyKind::Array);
    EXPECT_TRUE(contains(errorOfReadingBinary(fileOf(scalar, true)), kTooManyValues));
  }
}

/// A text of some length below 256 as it stands in a file.
std::string encodedText(std::size_t length, char character) {
  using namespace std::string_literals;
  return "\x5F\x10"s + static_cast<char>(length) + std::string(length, character);
}

/// A dictionary that stands for as many values as the limit but for what its key counts.
std::string fileAtTheLimitWithKeyOf(std::size_t length) {
  return fileWith([length](BinaryFile& file) {
    const std::size_t key = file.add(encodedText(length, 'k'));
    file.addContainer(kDictionaryOfOne, {key, addDoublingArrays(file, kDepthOfNearlyAllValues)});
  });
}

TEST(BinaryLimits, AKeyCountsForEveryWholePieceOfItsBytesOnly) {
  EXPECT_EQ(readBinary(fileAtTheLimitWithKeyOf(kBytesPerExpandedValue - 1)).kind(),
            PropertyKind::Dictionary);
  EXPECT_TRUE(contains(errorOfReadingBinary(fileAtTheLimitWithKeyOf(kBytesPerExpandedValue)),
                       kTooManyValues));
}

TEST(BinaryLimits, EveryKeyOfADictionaryCounts) {
  const auto fileWithKeysOf = [](std::size_t firstLength, std::size_t secondLength) {
    return fileWith([&](BinaryFile& file) {
      const std::size_t first = file.add(encodedText(firstLength, 'k'));
      const std::size_t second = file.add(encodedText(secondLength, 'l'));
      // Twice half of the limit less one, and the dictionary: room for one more.
      const std::size_t half = addDoublingArrays(file, kDepthOfNearlyAllValues - 1);
      file.addContainer('\xD2', {first, second, half, half});
    });
  };
  constexpr std::size_t kPiece = kBytesPerExpandedValue;
  EXPECT_EQ(readBinary(fileWithKeysOf(kPiece, 1)).kind(), PropertyKind::Dictionary);
  EXPECT_EQ(readBinary(fileWithKeysOf(1, kPiece)).kind(), PropertyKind::Dictionary);
  EXPECT_TRUE(contains(errorOfReadingBinary(fileWithKeysOf(kPiece, kPiece)), kTooManyValues));
}

TEST(BinaryLimits, ALargeFileMayStandForNoMoreThanAnyValueMay) {
  EXPECT_EQ(maximumExpandedValueCount(kMaximumFileSize), kMaximumExpandedValueCount);
}

/// Arrays in each other as deep as `height`, of which the lower half is read first, as the child of
/// the outermost array.
std::string fileWithSharedLowerHalf(std::size_t height) {
  BinaryFile file;
  file.setReferenceSize(2);
  const auto addArray = [&](const std::vector<std::size_t>& children) {
    std::string array(1, static_cast<char>(0xA0 + children.size()));
    for (const std::size_t child : children) {
      BinaryFile::appendNumber(array, child, 2);
    }
    file.add(array);
  };
  addArray({height / 2, 1});
  for (std::size_t object = 1; object + 1 < height; ++object) {
    addArray({object + 1});
  }
  addArray({});
  file.setTopObject(0);
  return file.build();
}

constexpr std::uint64_t kMostRepetitions = maximumRepeatedContainerCount(kFileSize);
constexpr const char* kTooManyRepetitions =
    "a container that repeats more containers than a file of this size may";

/// Adds an array that holds one object so many times.
std::size_t addArrayOf(BinaryFile& file, std::size_t object, std::uint64_t count) {
  std::string array = "\xAF\x11";
  BinaryFile::appendNumber(array, count, 2);
  return file.add(array.append(count, static_cast<char>(object)));
}

TEST(BinaryLimits, AContainerMayBeReachedAgainAsOftenAsTheLimit) {
  const auto fileOf = [](std::uint64_t repetitions) {
    return fileWith([&](BinaryFile& file) {
      addArrayOf(file, file.addContainer('\xD0', {}), 1 + repetitions);
    });
  };
  EXPECT_EQ(readBinary(fileOf(kMostRepetitions)).asArray()->size(), 1 + kMostRepetitions);
  EXPECT_TRUE(contains(errorOfReadingBinary(fileOf(kMostRepetitions + 1)), kTooManyRepetitions));
}

TEST(BinaryLimits, WhatARepeatedContainerHoldsIsRepeated) {
  // Ten arrays of `each` containers: the first array and its first container repeat nothing.
  const auto fileOf = [](std::uint64_t each, std::uint64_t further) {
    return fileWith([&](BinaryFile& file) {
      const std::size_t container = file.add("\xA0");
      const std::size_t array = addArrayOf(file, container, each);
      std::vector<std::size_t> children(10, array);
      children.resize(10 + further, container);
      file.addContainer(static_cast<char>(0xA0 + children.size()), children);
    });
  };
  constexpr std::uint64_t kEach = (kMostRepetitions + 1 - 9) / 10;
  constexpr std::uint64_t kFurther = kMostRepetitions - (10 * kEach - 1 + 9);
  static_assert(10 + kFurther < 14);
  EXPECT_EQ(readBinary(fileOf(kEach, kFurther)).kind(), PropertyKind::Array);
  EXPECT_TRUE(contains(errorOfReadingBinary(fileOf(kEach, kFurther + 1)), kTooManyRepetitions));
}

TEST(BinaryLimits, ContainersOfTheirOwnRepeatNothing) {
  constexpr std::size_t kContainers = 20'000;
  BinaryFile file;
  file.setOffsetSize(3);
  file.setReferenceSize(2);
  std::string array = "\xAF\x11";
  BinaryFile::appendNumber(array, kContainers, 2);
  for (std::size_t count = 0; count < kContainers; ++count) {
    BinaryFile::appendNumber(array, file.add("\xA0"), 2);
  }
  file.add(array);

  EXPECT_LT(maximumRepeatedContainerCount(file.build().size()), kContainers);
  EXPECT_EQ(readBinary(file.build()).asArray()->size(), kContainers);
}

TEST(BinaryLimits, ASharedChildMayReachAsDeepAsTheLimit) {
  EXPECT_EQ(readBinary(fileWithSharedLowerHalf(kMaximumNestingDepth)).kind(), PropertyKind::Array);
}

TEST(BinaryLimits, AChildReadAtALowerLevelCountsWithItsWholeHeightAtAHigherOne) {
  // Neither half is too deep.
  EXPECT_TRUE(contains(errorOfReadingBinary(fileWithSharedLowerHalf(2 * kMaximumNestingDepth - 3)),
                       "nested deeper than the limit"));
}

TEST(BinaryLimits, ASharedChildThatReachesOneLevelDeeperIsRefused) {
  EXPECT_TRUE(contains(errorOfReadingBinary(fileWithSharedLowerHalf(kMaximumNestingDepth + 1)),
                       "containers nested deeper than the limit"));
}

/// An array of two that says that its objects are the text "xy", and the last byte of that text or
/// the one behind it.
std::string fileWithOverlapOf(std::size_t byteCount) {
  BinaryFile file;
  file.addContainer(kArrayOfTwo, {1, 2});
  const std::size_t text = file.add("\x52x\x08");
  const std::size_t behind = file.add(byteCount == 0 ? "\x09" : "");
  // The header, the array and the text.
  file.setOffset(behind, 8 + 3 + 3 - byteCount);
  EXPECT_EQ(text, 1U);
  file.setTopObject(0);
  return file.build();
}

TEST(BinaryLimits, ObjectsMayFillTheFile) {
  EXPECT_EQ(readBinary(fileWithOverlapOf(0)), PropertyValue(PropertyArray{"x\x08", true}));
}

TEST(BinaryLimits, AnOverlapOfOneByteIsRefused) {
  EXPECT_TRUE(
      contains(errorOfReadingBinary(fileWithOverlapOf(1)), "an object that overlaps others"));
}

/// A dictionary at the end of the objects whose head says three entries, and that has so many
/// references. Behind it comes the offset table, whose zeros could pass for references.
std::string fileWithReferencesOfThreeEntries(std::size_t referenceCount) {
  BinaryFile file;
  const std::string unused(30, 'u');
  file.add("\x51k" + unused);
  file.add("\x51l");
  file.add("\x51m");
  std::string dictionary = "\xD3";
  for (std::size_t reference = 0; reference < referenceCount; ++reference) {
    dictionary += static_cast<char>(reference % 3);
  }
  file.add(dictionary);
  return file.build();
}

TEST(BinaryLimits, ADictionarysReferencesMayEndWithTheObjects) {
  EXPECT_EQ(readBinary(fileWithReferencesOfThreeEntries(6)),
            PropertyValue(PropertyDictionary{{"k", "k"}, {"l", "l"}, {"m", "m"}}));
}

TEST(BinaryLimits, ADictionaryWithAnyReferenceBeyondTheObjectsIsRefused) {
  for (std::size_t count = 0; count < 6; ++count) {
    EXPECT_TRUE(contains(errorOfReadingBinary(fileWithReferencesOfThreeEntries(count)),
                         "a container that ends beyond the objects"))
        << count;
  }
}

}  // namespace
}  // namespace accounts
