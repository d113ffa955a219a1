#include "propertylist/value/PropertyValue.h"

#include <gtest/gtest.h>

#include <bit>

#include "tests/propertylist/PropertyListTesting.h"

namespace accounts {
namespace {

TEST(PropertyValueKind, EveryContentHasItsKind) {
  EXPECT_EQ(PropertyValue(PropertyDictionary()).kind(), PropertyKind::Dictionary);
  EXPECT_EQ(PropertyValue(PropertyArray()).kind(), PropertyKind::Array);
  EXPECT_EQ(PropertyValue("text").kind(), PropertyKind::String);
  EXPECT_EQ(PropertyValue(1).kind(), PropertyKind::Integer);
  EXPECT_EQ(PropertyValue(std::numeric_limits<std::uint64_t>::max()).kind(), PropertyKind::Integer);
  EXPECT_EQ(PropertyValue(1.0).kind(), PropertyKind::Real);
  EXPECT_EQ(PropertyValue(true).kind(), PropertyKind::Boolean);
  EXPECT_EQ(PropertyValue(PropertyDate{1}).kind(), PropertyKind::Date);
  EXPECT_EQ(PropertyValue(PropertyData("bytes")).kind(), PropertyKind::Data);
}

TEST(PropertyValueKind, AContentIsNotGivenAsAnotherKind) {
  const PropertyValue integer(1);

  EXPECT_EQ(integer.asBoolean(), nullptr);
  EXPECT_EQ(integer.asReal(), nullptr);
  EXPECT_EQ(integer.asText(), nullptr);
  EXPECT_EQ(integer.asDate(), nullptr);
  EXPECT_EQ(integer.asLargeUnsigned(), nullptr);
}

TEST(PropertyValueEquality, EqualContentsInDifferentMemoryAreEqual) {
  EXPECT_EQ(PropertyValue("text"), PropertyValue("text"));
  EXPECT_EQ(PropertyValue(PropertyData("x")), PropertyValue(PropertyData("x")));
  EXPECT_EQ(PropertyValue(PropertyArray{1, "two"}), PropertyValue(PropertyArray{1, "two"}));
  EXPECT_EQ(PropertyValue(PropertyDictionary{{"a", 1}, {"b", 2}}),
            PropertyValue(PropertyDictionary{{"b", 2}, {"a", 1}}));
}

TEST(PropertyValueEquality, DifferentContentsAreNotEqual) {
  EXPECT_FALSE(PropertyValue("text") == PropertyValue("Text"));
  EXPECT_FALSE(PropertyValue(1) == PropertyValue(2));
  EXPECT_FALSE(PropertyValue(PropertyData("x")) == PropertyValue(PropertyData("y")));
  EXPECT_FALSE(PropertyValue(PropertyArray{1, 2}) == PropertyValue(PropertyArray{2, 1}));
  EXPECT_FALSE(PropertyValue(PropertyArray{1}) == PropertyValue(PropertyArray{1, 1}));
  EXPECT_FALSE(PropertyValue(PropertyDictionary{{"a", 1}}) ==
               PropertyValue(PropertyDictionary{{"a", 2}}));
  EXPECT_FALSE(PropertyValue(PropertyDictionary{{"a", 1}}) ==
               PropertyValue(PropertyDictionary{{"b", 1}}));
}

TEST(PropertyValueEquality, ValuesOfDifferentKindsAreNeverEqual) {
  EXPECT_FALSE(PropertyValue(1) == PropertyValue(true));
  EXPECT_FALSE(PropertyValue(1) == PropertyValue(1.0));
  EXPECT_FALSE(PropertyValue(0) == PropertyValue(false));
  EXPECT_FALSE(PropertyValue("1") == PropertyValue(1));
  EXPECT_FALSE(PropertyValue(1.0) == PropertyValue(PropertyDate{1.0}));
  EXPECT_FALSE(PropertyValue("x") == PropertyValue(PropertyData("x")));
  EXPECT_FALSE(PropertyValue(PropertyArray()) == PropertyValue(PropertyDictionary()));
}

TEST(PropertyValueEquality, RealsAndDatesAreComparedByTheirBits) {
  EXPECT_EQ(PropertyValue(kNaN), PropertyValue(kNaN));
  EXPECT_EQ(PropertyValue(PropertyDate{kNaN}), PropertyValue(PropertyDate{kNaN}));
  EXPECT_FALSE(PropertyValue(0.0) == PropertyValue(-0.0));
  EXPECT_FALSE(PropertyValue(PropertyDate{0.0}) == PropertyValue(PropertyDate{-0.0}));
  const auto otherNaN = std::bit_cast<double>(std::bit_cast<std::uint64_t>(kNaN) | 1);
  EXPECT_FALSE(PropertyValue(kNaN) == PropertyValue(otherNaN));
}

TEST(PropertyValueEquality, AnIntegerIsTheSameHoweverItWasGiven) {
  EXPECT_EQ(PropertyValue(std::uint64_t{5}), PropertyValue(std::int64_t{5}));
  EXPECT_EQ(PropertyValue(std::uint8_t{5}), PropertyValue(5));
  EXPECT_FALSE(PropertyValue(std::uint64_t{1} << 63) ==
               PropertyValue(std::numeric_limits<std::int64_t>::min()));
}

TEST(PropertyValueEquality, EmptyContainersAreEqualWhetherTheyEverHeldSomethingOrNot) {
  PropertyArray array{"x"};
  array.removeText("x");
  PropertyDictionary dictionary{{"x", 1}};
  dictionary.remove("x");

  EXPECT_EQ(PropertyValue(array), PropertyValue(PropertyArray()));
  EXPECT_EQ(PropertyValue(dictionary), PropertyValue(PropertyDictionary()));
}

TEST(PropertyValueCopy, ACopySharesItsContentUntilOneOfThemChanges) {
  const PropertyDictionary original{{"a", 1}};
  PropertyDictionary copy = original;
  EXPECT_TRUE(copy.isSameAs(original));

  copy.set("a", 2);

  EXPECT_FALSE(copy.isSameAs(original));
}

TEST(PropertyValueCopy, AChangeToACopyIsNotSeenByTheOriginal) {
  PropertyArray array{1, 2};
  const PropertyArray arrayCopy = array;
  array.append(3);
  array.replace(0, "one");
  EXPECT_EQ(arrayCopy, (PropertyArray{1, 2}));
  EXPECT_EQ(array, (PropertyArray{"one", 2, 3}));

  PropertyDictionary dictionary{{"a", 1}};
  const PropertyDictionary dictionaryCopy = dictionary;
  dictionary.remove("a");
  dictionary.set("b", 2);
  EXPECT_EQ(dictionaryCopy, (PropertyDictionary{{"a", 1}}));
  EXPECT_EQ(dictionary, (PropertyDictionary{{"b", 2}}));
}

TEST(PropertyValueCopy, AChangeToTheOriginalIsNotSeenInsideAContainerThatHoldsIt) {
  PropertyArray inner{1};
  const PropertyDictionary outer{{"inner", inner}};

  inner.append(2);

  EXPECT_EQ(outer.arrayForKey("inner"), (PropertyArray{1}));
}

TEST(PropertyValueCopy, AssigningAValueToItselfKeepsIt) {
  PropertyValue value = PropertyArray{1, "two"};
  const PropertyValue& same = value;

  value = same;

  EXPECT_EQ(value, PropertyValue(PropertyArray{1, "two"}));
}

TEST(PropertyValueCopy, AMovedValueTakesItsContentAlong) {
  PropertyValue value = PropertyArray{1, "two"};

  const PropertyValue moved = std::move(value);

  EXPECT_EQ(moved, PropertyValue(PropertyArray{1, "two"}));
}

}  // namespace
}  // namespace accounts
