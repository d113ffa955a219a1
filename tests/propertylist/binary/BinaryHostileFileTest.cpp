#include <gtest/gtest.h>

#include <cstdlib>
#include <cstring>
#include <memory>
#include <string>

#include "propertylist/PropertyListLimits.h"
#include "tests/propertylist/PropertyListTesting.h"

namespace accounts {
namespace {

using namespace std::string_literals;

/// Arrays in each other, four-byte references. The innermost is empty and the last object.
std::string nestedArraysFile(std::size_t depth) {
  BinaryFile file;
  file.setReferenceSize(4);
  for (std::size_t level = 1; level < depth; ++level) {
    std::string array(1, kArrayOfOne);
    BinaryFile::appendNumber(array, level, 4);
    file.add(array);
  }
  file.add("\xA0");
  file.setTopObject(0);
  return file.build();
}

/// Each array but the innermost holds the next one twice.
std::string doublingArraysFile(std::size_t depth) {
  BinaryFile file;
  constexpr std::size_t kDepthOfFifteenValues = 4;
  std::size_t below = 1;
  for (std::size_t level = kDepthOfFifteenValues; level < depth; ++level, ++below) {
    file.addContainer(kArrayOfTwo, {below, below});
  }
  file.addContainer(kArrayOfFourteen, std::vector<std::size_t>(14, below));
  file.add("\x08");
  file.setTopObject(0);
  return file.build();
}

TEST(HostileBinaryFile, AFileLargerThanTheLimitIsRefused) {
  constexpr std::size_t kSize = kMaximumFileSize + 1;
  // Memory that nobody touches, and which is there only in name.
  const std::unique_ptr<char, decltype(&std::free)> bytes(static_cast<char*>(std::calloc(kSize, 1)),
                                                          &std::free);
  ASSERT_NE(bytes, nullptr);
  std::memcpy(bytes.get(), "bplist00", 8);
  EXPECT_TRUE(contains(errorOfReadingBinary({bytes.get(), kSize}), "larger than the limit"));
}

TEST(HostileBinaryFile, ContainersMayNestAsDeepAsTheLimit) {
  EXPECT_EQ(readBinary(nestedArraysFile(kMaximumNestingDepth)), nestedArrays(kMaximumNestingDepth));
}

TEST(HostileBinaryFile, ContainersNestedDeeperThanTheLimitAreRefused) {
  EXPECT_TRUE(contains(errorOfReadingBinary(nestedArraysFile(kMaximumNestingDepth + 1)),
                       "nested deeper than the limit"));
}

TEST(HostileBinaryFile, AMillionNestedContainersAreRefused) {
  EXPECT_TRUE(
      contains(errorOfReadingBinary(nestedArraysFile(1'000'000)), "nested deeper than the limit"));
}

TEST(HostileBinaryFile, SharedChildrenMayStandForAsManyValuesAsInAnyFile) {
  // Depth n stands for 2^n - 1 values.
  const PropertyValue value = readBinary(doublingArraysFile(13));

  ASSERT_NE(value.asArray(), nullptr);
  EXPECT_EQ(value.asArray()->size(), 2U);
}

TEST(HostileBinaryFile, SharedChildrenThatStandForMoreValuesAreRefused) {
  EXPECT_TRUE(contains(errorOfReadingBinary(doublingArraysFile(14)),
                       "stands for more values than a file of this size may"));
}

TEST(HostileBinaryFile, ASmallFileThatStandsForBillionsOfValuesIsRefused) {
  EXPECT_TRUE(contains(errorOfReadingBinary(doublingArraysFile(60)),
                       "stands for more values than a file of this size may"));
  EXPECT_TRUE(contains(errorOfReadingBinary(doublingArraysFile(200)),
                       "stands for more values than a file of this size may"));
}

/// An array that holds one long text, or a dictionary whose one key it is, very often.
std::string repeatedTextFile(bool isKey) {
  constexpr std::size_t kTextSize = 100'000;
  constexpr std::size_t kRepetitions = 60'000;
  BinaryFile file;
  std::string text = "\x5F\x12"s;
  BinaryFile::appendNumber(text, kTextSize, 4);
  const std::size_t textNumber = file.add(text + std::string(kTextSize, 'x'));
  const std::size_t repeated =
      isKey ? file.addContainer(kDictionaryOfOne, {textNumber, file.add("\x08")}) : textNumber;
  std::string array = "\xAF\x12"s;
  BinaryFile::appendNumber(array, kRepetitions, 4);
  const std::size_t arrayNumber =
      file.add(array + std::string(kRepetitions, static_cast<char>(repeated)));
  file.setTopObject(arrayNumber);
  return file.build();
}

TEST(HostileBinaryFile, ALongTextReachedTooOftenIsRefused) {
  EXPECT_TRUE(contains(errorOfReadingBinary(repeatedTextFile(/*isKey=*/false)),
                       "stands for more values than a file of this size may"));
}

TEST(HostileBinaryFile, ALongKeyReachedTooOftenIsRefused) {
  EXPECT_TRUE(contains(errorOfReadingBinary(repeatedTextFile(/*isKey=*/true)),
                       "stands for more values than a file of this size may"));
}

TEST(HostileBinaryFile, AContainerThatContainsItselfIsRefused) {
  BinaryFile array;
  array.addContainer(kArrayOfOne, {0});
  EXPECT_TRUE(contains(errorOfReadingBinary(array.build()), "a container that contains itself"));

  BinaryFile dictionary;
  dictionary.add("\x51k");
  dictionary.addContainer(kDictionaryOfOne, {0, 1});
  EXPECT_TRUE(
      contains(errorOfReadingBinary(dictionary.build()), "a container that contains itself"));
}

TEST(HostileBinaryFile, ALongerCircleIsRefused) {
  BinaryFile file;
  file.addContainer(kArrayOfOne, {1});
  file.addContainer(kArrayOfOne, {2});
  file.addContainer(kArrayOfOne, {0});

  EXPECT_TRUE(contains(errorOfReadingBinary(file.build()), "a container that contains itself"));
}

TEST(HostileBinaryFile, AContainerThatIsItsOwnKeyIsRefused) {
  BinaryFile file;
  file.addContainer(kDictionaryOfOne, {0, 0});

  errorOfReadingBinary(file.build());
}

TEST(HostileBinaryFile, ObjectsThatLieAcrossEachOtherAreRefused) {
  // Each text begins within the one before: a thousand of them would take a thousand times the
  // file in memory.
  constexpr std::size_t kCount = 100;
  BinaryFile file;
  std::string texts;
  for (std::size_t index = 0; index < kCount; ++index) {
    texts += "\x5F\x11\x03\x01";
  }
  file.add(texts + std::string(1000, 'x'));
  std::string array = "\xAF\x10"s + static_cast<char>(kCount);
  for (std::size_t index = 0; index < kCount; ++index) {
    array.push_back(static_cast<char>(index));
  }
  for (std::size_t index = 1; index < kCount; ++index) {
    file.setOffset(file.add(""), 8 + 4 * index);
  }
  file.add(array);

  EXPECT_TRUE(contains(errorOfReadingBinary(file.build()), "an object that overlaps others"));
}

}  // namespace
}  // namespace accounts
