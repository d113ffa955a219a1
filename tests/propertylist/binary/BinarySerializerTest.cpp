#include <gtest/gtest.h>

#include <cstddef>
#include <string>
#include <vector>

#include "propertylist/PropertyListLimits.h"
#include "propertylist/binary/BinaryPropertyListSerializer.h"
#include "tests/propertylist/PropertyListTesting.h"

namespace accounts {
namespace {

class BinarySerializer : public testing::Test {
 protected:
  bool serialize(const PropertyValue& value) { return serializer_.serialize(value).has_value(); }
  std::string bytesFor(const PropertyValue& value) {
    return bytesOf(serializer_.serialize(value).value());
  }
  /// Why a value is not serialised.
  std::string refusal(const PropertyValue& value) {
    const auto serialized = serializer_.serialize(value);
    return serialized ? "" : serialized.error().text;
  }

 private:
  BinaryPropertyListSerializer serializer_;
};

PropertyDictionary store(PropertyArray accounts) {
  return {{"Accounts", std::move(accounts)}, {"Version", 12}};
}

/// An account that stands for a quarter of as many values as may be, and a few more.
PropertyDictionary largeAccount() {
  constexpr std::size_t kSideLength = std::size_t{1} << 11;
  PropertyArray line = PropertyArray::withRoomFor(kSideLength);
  PropertyArray square = PropertyArray::withRoomFor(kSideLength);
  for (std::size_t index = 0; index < kSideLength; ++index) {
    line.append(7);
  }
  for (std::size_t index = 0; index < kSideLength; ++index) {
    square.append(line);
  }
  static_assert(kSideLength * kSideLength == kMaximumExpandedValueCount / 4);
  return {{"Values", square}};
}

TEST_F(BinarySerializer, TheBytesAreThoseOfTheWriter) {
  const PropertyValue value = valueOfEveryKind();
  EXPECT_EQ(bytesFor(value), writeBinary(value));
}

TEST_F(BinarySerializer, EachValueGetsItsOwnBytesWhateverWentBefore) {
  PropertyArray accounts;
  for (int stage = 0; stage < 40; ++stage) {
    accounts.append(PropertyDictionary{{"Identifier", stage}, {"Type", "Mail"}});
    if (stage % 3 == 2) {
      accounts.replace(static_cast<std::size_t>(stage) / 3, PropertyDictionary{{"New", stage}});
    }
    ASSERT_EQ(bytesFor(store(accounts)), writeBinary(store(accounts))) << "stage " << stage;
  }
}

TEST_F(BinarySerializer, WhatIsNestedAsDeeplyAsTheReaderGoesPassesAndNoDeeper) {
  EXPECT_TRUE(serialize(nestedArrays(kMaximumNestingDepth)));
  EXPECT_TRUE(contains(refusal(nestedArrays(kMaximumNestingDepth + 1)), "nested deeper"));
}

TEST_F(BinarySerializer, DepthCountsFromTheRootOfAStore) {
  const auto account = [](std::size_t depth) {
    return store({PropertyDictionary{{"Deep", nestedArrays(depth)}}});
  };
  EXPECT_TRUE(serialize(account(kMaximumNestingDepth - 3)));
  EXPECT_FALSE(serialize(account(kMaximumNestingDepth - 2)));
}

TEST_F(BinarySerializer, AnAccountThatChangedIsLookedAtAgain) {
  PropertyArray accounts = {PropertyDictionary{{"Identifier", "A"}},
                            PropertyDictionary{{"Identifier", "B"}}};
  ASSERT_TRUE(serialize(store(accounts)));

  accounts.replace(1, PropertyDictionary{{"Deep", nestedArrays(kMaximumNestingDepth)}});

  EXPECT_FALSE(serialize(store(accounts)));
}

TEST_F(BinarySerializer, ATextThatIsNotWellFormedIsRefusedInEveryPlace) {
  const std::string malformed = "\xFF";
  for (const PropertyValue& value :
       {PropertyValue(malformed), PropertyValue(PropertyArray{malformed}),
        PropertyValue(PropertyDictionary{{malformed, 1}}),
        PropertyValue(store({PropertyDictionary{{"Name", malformed}}})),
        PropertyValue(store({PropertyDictionary{{malformed, "Name"}}})),
        PropertyValue(PropertyDictionary{{malformed, PropertyArray{}}})}) {
    EXPECT_TRUE(contains(refusal(value), "well-formed"));
  }
}

TEST_F(BinarySerializer, AValueThatStandsForTooManyValuesIsRefused) {
  const PropertyDictionary large = largeAccount();
  EXPECT_TRUE(serialize(store({large})));
  EXPECT_TRUE(contains(refusal(store({large, large, large, large})), "more values than the limit"));
}

TEST_F(BinarySerializer, AccountsThatArePassedOverBecauseTheyAreKnownStillCount) {
  const PropertyDictionary large = largeAccount();
  const PropertyDictionary small = {{"Identifier", "small"}};
  ASSERT_TRUE(serialize(store({small, large})));
  ASSERT_TRUE(serialize(store({large, small})));

  EXPECT_FALSE(serialize(store({large, large, small, large, large})));
}

TEST_F(BinarySerializer, LongTextsDataAndKeysCountMoreThanOnce) {
  // So long that a file that has it once may stand for as many values as any may.
  const std::string content(kMaximumExpandedValueCount, 'c');
  const PropertyValue text = content;
  const PropertyValue data = PropertyData(content);
  const PropertyValue dictionary = PropertyDictionary{{content, 1}};
  for (const PropertyValue& value : {text, data, dictionary}) {
    const std::vector<PropertyValue> asManyAsMayBe(kBytesPerExpandedValue - 1, value);
    EXPECT_TRUE(serialize(PropertyArray(asManyAsMayBe)));
    const std::vector<PropertyValue> tooMany(kBytesPerExpandedValue, value);
    EXPECT_FALSE(serialize(PropertyArray(tooMany)));
  }
}

TEST_F(BinarySerializer, AFileTooSmallForWhatItStandsForIsNotMade) {
  const auto list = [](std::size_t count) {
    return PropertyValue(PropertyArray(std::vector<PropertyValue>(count, std::string(640, 't'))));
  };
  // Each text counts eleven times and takes a byte besides the first.
  constexpr std::size_t kMost = 888;
  EXPECT_EQ(readBinary(writeBinary(list(kMost))), list(kMost));

  const auto bytes = writeBinaryPropertyList(list(kMost + 1));

  ASSERT_FALSE(bytes);
  EXPECT_TRUE(contains(bytes.error().text, "more values than a file of its size may stand for"));
  // Before the bytes are made it costs too much to find out, but they never seem whole.
  const SerializedPropertyList tooSmall =
      BinaryPropertyListSerializer().serialize(list(kMost + 1)).value();
  EXPECT_FALSE(tooSmall.giveTo([](std::string_view) { return true; }));
}

TEST_F(BinarySerializer, AFileTooSmallForWhatItRepeatsIsNotMade) {
  const auto list = [](std::size_t count) {
    return PropertyValue(PropertyArray(std::vector<PropertyValue>(count, PropertyArray())));
  };
  // Each takes a byte besides the first.
  constexpr std::size_t kMost = 4689;
  EXPECT_EQ(readBinary(writeBinary(list(kMost))), list(kMost));

  EXPECT_FALSE(writeBinaryPropertyList(list(kMost + 1)));
}

TEST_F(BinarySerializer, AValueWhoseFileTheReaderWouldFindTooLargeIsRefused) {
  EXPECT_TRUE(contains(refusal(PropertyData(std::string(kMaximumFileSize - 8, '\0'))),
                       "more objects or bytes than the limit"));
}

TEST_F(BinarySerializer, EqualPartsCountOnceForTheSizeOfTheFile) {
  constexpr std::size_t kLarge = std::size_t{1} << 25;
  const PropertyData data(std::string(kLarge, 'd'));
  const std::vector<PropertyValue> many(kMaximumFileSize / kLarge + 1, data);

  EXPECT_TRUE(serialize(PropertyArray(many)));
}

}  // namespace
}  // namespace accounts
