#include <gtest/gtest.h>

#include <string>
#include <vector>

#include "propertylist/binary/BinaryPropertyListSerializer.h"
#include "tests/propertylist/PropertyListTesting.h"

namespace accounts {
namespace {

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

SerializedPropertyList serialized(const PropertyValue& value) {
  return BinaryPropertyListSerializer().serialize(value).value();
}

TEST(BinaryPieces, ASmallFileIsOnePiece) {
  EXPECT_EQ(piecesOf(serialized(PropertyArray{"a", 1})).size(), 1u);
}

TEST(BinaryPieces, ALargeFileIsGivenInPiecesThatMakeItUp) {
  const PropertyValue value = largeValue();

  const std::vector<std::string> pieces = piecesOf(serialized(value));

  EXPECT_GT(pieces.size(), 4u);
  for (const std::string& piece : pieces) {
    EXPECT_LE(piece.size(), std::size_t{512} << 10);
  }
  EXPECT_TRUE(bytesOf(serialized(value)) == writeBinary(value));
  EXPECT_TRUE(readBinary(writeBinary(value)) == value);
}

TEST(BinaryPieces, AFileGivesNoPieceAfterTheOneThatIsNotGoneOnAfter) {
  const SerializedPropertyList large = serialized(largeValue());
  for (const std::size_t last : {1u, 2u, 5u}) {
    std::size_t count = 0;
    EXPECT_FALSE(large.giveTo([&](std::string_view) { return ++count < last; }));
    EXPECT_EQ(count, last);
  }
}

}  // namespace
}  // namespace accounts
