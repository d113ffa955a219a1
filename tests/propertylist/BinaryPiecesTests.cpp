#include <gtest/gtest.h>

#include <string>
#include <vector>

#include "propertylist/BinaryPropertyList.h"
#include "tests/propertylist/PropertyListTesting.h"

namespace accounts {
namespace {

using testing::piecesOf;

/// A value whose file has several pieces: each kind of content that can be long goes over the end
/// of one.
PropertyValue largeValue() {
  constexpr std::size_t kMuch = 700'000;
  std::string twoByteUnits;
  std::string fourByteUnits;
  std::vector<PropertyValue> numbers;
  for (std::size_t number = 0; number < kMuch / 2; ++number) {
    twoByteUnits += "\xC3\xA4";
    fourByteUnits += "\xF0\x9F\x93\xA7";
    numbers.emplace_back(number);
  }
  return PropertyDictionary{{"Data", PropertyData(std::string(kMuch, 'd'))},
                            {"Text", std::string(kMuch, 't')},
                            {"TwoByteUnits", twoByteUnits},
                            {"FourByteUnits", "x" + fourByteUnits},
                            {"Numbers", PropertyArray(std::move(numbers))}};
}

TEST(BinaryPieces, ASmallFileIsOnePiece) {
  BinaryPropertyListWriter writer;
  PropertyListError error;
  const auto bytes = writer.write(PropertyArray{"a", 1}, error);
  ASSERT_TRUE(bytes);
  EXPECT_EQ(piecesOf(*bytes).size(), 1u);
}

TEST(BinaryPieces, ALargeFileIsGivenInPiecesThatMakeItUp) {
  const PropertyValue value = largeValue();
  BinaryPropertyListWriter writer;
  PropertyListError error;
  const auto bytes = writer.write(value, error);
  ASSERT_TRUE(bytes);

  EXPECT_GT(piecesOf(*bytes).size(), 4u);
  EXPECT_EQ(bytes->whole().size(), bytes->size());
  EXPECT_TRUE(testing::readBinary(bytes->whole()) == value);
}

TEST(BinaryPieces, TheBytesOfAFileCanBeAskedForAgain) {
  BinaryPropertyListWriter writer;
  PropertyListError error;
  const auto bytes = writer.write(PropertyArray{"a", PropertyDictionary{{"b", 1}}}, error);
  ASSERT_TRUE(bytes);
  EXPECT_EQ(bytes->whole(), bytes->whole());
}

TEST(BinaryPieces, AFileGivesNoPieceAfterTheOneThatIsNotGoneOnAfter) {
  BinaryPropertyListWriter writer;
  PropertyListError error;
  const auto bytes = writer.write(largeValue(), error);
  ASSERT_TRUE(bytes);
  for (const std::size_t last : {1u, 2u, 5u}) {
    std::size_t count = 0;
    EXPECT_FALSE(bytes->giveTo([&](std::string_view) { return ++count < last; }));
    EXPECT_EQ(count, last);
  }
}

}  // namespace
}  // namespace accounts
