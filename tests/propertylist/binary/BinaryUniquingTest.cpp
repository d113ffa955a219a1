#include <gtest/gtest.h>

#include <algorithm>
#include <random>
#include <string>
#include <vector>

#include "tests/propertylist/PropertyListTesting.h"

// Equal parts of a value are one object of its binary file, whether or not they share memory.

namespace accounts {
namespace {

PropertyArray arrayOf(PropertyValue value) {
  return PropertyArray({std::move(value)});
}

void addDifferentParts(const PropertyValue& value, std::vector<PropertyValue>& parts) {
  if (std::find(parts.begin(), parts.end(), value) != parts.end()) {
    return;
  }
  parts.push_back(value);
  if (const PropertyArray* array = value.asArray()) {
    for (const PropertyValue& element : *array) {
      addDifferentParts(element, parts);
    }
  } else if (const PropertyDictionary* dictionary = value.asDictionary()) {
    for (const PropertyEntry& entry : *dictionary) {
      addDifferentParts(PropertyValue(entry.key), parts);
      addDifferentParts(entry.value, parts);
    }
  }
}

/// A value of few different scalars, so that many of its parts are equal.
PropertyValue valueOfFewScalars(std::mt19937& random, int depth) {
  const auto scalar = [&]() -> PropertyValue {
    return random() % 2 == 0 ? PropertyValue(std::string(1, static_cast<char>('a' + random() % 4)))
                             : PropertyValue(static_cast<int>(random() % 3));
  };
  if (depth == 0 || random() % 4 == 0) {
    return scalar();
  }
  PropertyArray elements;
  PropertyDictionary entries;
  for (std::uint32_t count = random() % 4; count > 0; --count) {
    const PropertyValue child = valueOfFewScalars(random, depth - 1);
    elements.append(child);
    entries.set(std::string(1, static_cast<char>('a' + random() % 4)), child);
  }
  return random() % 2 == 0 ? PropertyValue(elements) : PropertyValue(entries);
}

TEST(BinaryUniquing, AContainerIsKnownAgainByAScalarThatItWasTheFirstToHold) {
  const PropertyValue value = PropertyArray{PropertyArray{"new", 1}, PropertyArray{"new", 1}};

  EXPECT_EQ(objectCount(writeBinary(value)), 4U);
}

TEST(BinaryUniquing, AContainerAroundAnotherOneThatHoldsItsNewScalarIsKnownAgain) {
  const auto part = [] { return PropertyArray{PropertyValue(arrayOf("new")), "new"}; };

  EXPECT_EQ(objectCount(writeBinary(PropertyArray{part(), part()})), 4U);
}

TEST(BinaryUniquing, ContainersOfContainersAloneAreKnownAgain) {
  const auto part = [] { return arrayOf(arrayOf(PropertyArray())); };

  EXPECT_EQ(objectCount(writeBinary(PropertyArray{part(), part()})), 4U);
}

TEST(BinaryUniquing, ContainersThatDifferInOldScalarsAloneAreDifferentObjects) {
  const PropertyValue value = PropertyArray{PropertyArray{1, 2}, PropertyArray{2, 1},
                                            PropertyArray{2}, PropertyDictionary{{"k", 2}}};

  const std::string file = writeBinary(value);

  EXPECT_EQ(objectCount(file), 8U);
  EXPECT_EQ(readBinary(file), value);
}

TEST(BinaryUniquing, EachDifferentPartOfAValueIsOneObject) {
  std::mt19937 random(1);
  for (int round = 0; round < 300; ++round) {
    const PropertyValue value = valueOfFewScalars(random, 5);
    std::vector<PropertyValue> parts;
    addDifferentParts(value, parts);

    const std::string file = writeBinary(value);

    ASSERT_EQ(objectCount(file), parts.size()) << "round " << round;
    ASSERT_EQ(readBinary(file), value) << "round " << round;
  }
}

}  // namespace
}  // namespace accounts
