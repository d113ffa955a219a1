#include "propertylist/BytesInPieces.h"

#include <gtest/gtest.h>

#include <string>
#include <vector>

#include "tests/propertylist/PropertyListTesting.h"

namespace accounts {
namespace {

using testing::piecesOf;

TEST(BytesInPieces, NoneAreGivenWithoutAPiece) {
  EXPECT_EQ(BytesInPieces().size(), 0u);
  EXPECT_TRUE(piecesOf(BytesInPieces()).empty());
}

TEST(BytesInPieces, ATextIsOnePiece) {
  const std::string text = "a text";
  const BytesInPieces bytes = text;
  EXPECT_EQ(bytes.size(), text.size());
  EXPECT_EQ(piecesOf(bytes), std::vector{text});
}

}  // namespace
}  // namespace accounts
