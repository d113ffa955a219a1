#include <gtest/gtest.h>

#include <string>

#include "propertylist/PropertyListLimits.h"
#include "propertylist/xml/XMLPropertyListBuilder.h"

// What counts towards the limit of values, with a limit small enough to be met exactly.

namespace accounts::xmlplist {
namespace {

constexpr std::string_view kProblem = "more values than the limit";

/// A document that gives its events to a builder with a limit, and the builder's answer.
class Document {
 public:
  explicit Document(std::uint64_t limit) : builder_(limit) { start("plist"); }

  Document& start(std::string_view element) {
    isGood_ = isGood_ && builder_.start(element);
    return *this;
  }
  Document& end() {
    isGood_ = isGood_ && builder_.end();
    return *this;
  }
  Document& holding(std::string_view element, std::string_view characters) {
    start(element);
    isGood_ = isGood_ && builder_.addCharacters(characters);
    return end();
  }
  /// Whether the limit allows it.
  bool isAllowed() {
    end();
    EXPECT_EQ(builder_.problem(), isGood_ ? "" : kProblem);
    return isGood_;
  }

 private:
  ValueBuilder builder_;
  bool isGood_ = true;
};

const std::string kOnePiece(kBytesPerExpandedValue, 'Q');
const std::string kLessThanAPiece(kBytesPerExpandedValue - 1, 'Q');

TEST(XMLLimits, EveryScalarAndContainerIsAValue) {
  const auto document = [](std::uint64_t limit) {
    Document made(limit);
    made.start("dict").holding("key", "k").holding("string", "text");
    made.holding("key", "l").start("array").holding("integer", "1").start("true").end().end();
    return made.end().isAllowed();
  };
  EXPECT_TRUE(document(5));
  EXPECT_FALSE(document(4));
}

TEST(XMLLimits, ALongTextCountsOnceMoreForEveryPieceOfItsBytes) {
  const auto document = [](std::uint64_t limit, const std::string& text) {
    return Document(limit).holding("string", text).isAllowed();
  };
  EXPECT_TRUE(document(1, kLessThanAPiece));
  EXPECT_FALSE(document(1, kOnePiece));
  EXPECT_TRUE(document(3, kOnePiece + kOnePiece));
  EXPECT_FALSE(document(2, kOnePiece + kOnePiece));
}

TEST(XMLLimits, LongDataCountsOnceMoreForEveryPieceOfItsDigits) {
  const auto document = [](std::uint64_t limit) {
    return Document(limit).holding("data", kOnePiece).isAllowed();
  };
  EXPECT_TRUE(document(2));
  EXPECT_FALSE(document(1));
}

TEST(XMLLimits, ALongKeyCountsForEveryPieceOfItsBytes) {
  const auto document = [](std::uint64_t limit, const std::string& key) {
    Document made(limit);
    made.start("dict").holding("key", key).start("true").end();
    return made.end().isAllowed();
  };
  EXPECT_TRUE(document(2, kLessThanAPiece));
  EXPECT_FALSE(document(2, kOnePiece));
  EXPECT_TRUE(document(3, kOnePiece));
}

TEST(XMLLimits, AKeyThatIsRepeatedCountsEachTime) {
  const auto document = [](std::uint64_t limit) {
    Document made(limit);
    made.start("array");
    for (int dictionary = 0; dictionary < 2; ++dictionary) {
      made.start("dict").holding("key", kOnePiece).start("true").end().end();
    }
    return made.end().isAllowed();
  };
  EXPECT_TRUE(document(7));
  EXPECT_FALSE(document(6));
}

}  // namespace
}  // namespace accounts::xmlplist
