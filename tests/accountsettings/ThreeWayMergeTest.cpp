#include "accountsettings/ThreeWayMerge.h"

#include <gtest/gtest.h>

#include <array>
#include <optional>

namespace accounts {
namespace {

/// What one side has under a key: a number, or nothing.
using Side = std::optional<int>;

/// One key on all three sides.
struct Combination {
  Side inMemory;
  Side original;
  Side onDisk;
};

/// Absent, and enough values for every pattern of equal and different ones.
constexpr std::array<Side, 4> sides = {std::nullopt, 1, 2, 3};

std::vector<Combination> allCombinations() {
  std::vector<Combination> combinations;
  for (const Side inMemory : sides) {
    for (const Side original : sides) {
      for (const Side onDisk : sides) {
        combinations.push_back({inMemory, original, onDisk});
      }
    }
  }
  return combinations;
}

/// The rule, one row of the table after the other.
Side expected(const Combination& key) {
  const bool isNewInMemory = key.inMemory && !key.original;
  const bool isChangedInMemory = key.inMemory && key.original && *key.inMemory != *key.original;
  const bool isUnchangedInMemory = key.inMemory && key.original && *key.inMemory == *key.original;
  const bool isDeletedInMemory = !key.inMemory && key.original;
  if (isNewInMemory || isChangedInMemory) {
    return key.inMemory;
  }
  if (isUnchangedInMemory) {
    return key.onDisk;
  }
  if (isDeletedInMemory) {
    return std::nullopt;
  }
  return key.onDisk;
}

/// Puts a value into a dictionary that has one there.
void put(PropertyDictionary& dictionary, std::string_view key, Side side) {
  if (side) {
    dictionary.set(key, *side);
  }
}

/// Merges dictionaries of some keys, beside one that all three sides have, so that no side counts
/// as absent.
PropertyDictionary merged(const std::vector<std::pair<Text, Combination>>& keys) {
  PropertyDictionary inMemory = {{"common", 0}};
  PropertyDictionary original = {{"common", 0}};
  PropertyDictionary onDisk = {{"common", 0}};
  for (const auto& [key, combination] : keys) {
    put(inMemory, key, combination.inMemory);
    put(original, key, combination.original);
    put(onDisk, key, combination.onDisk);
  }
  return mergeThreeWays(inMemory, original, onDisk);
}

TEST(ThreeWayMerge, EveryCombinationOfOneKeyFollowsTheTable) {
  for (const Combination& combination : allCombinations()) {
    PropertyDictionary result = {{"common", 0}};
    put(result, "key", expected(combination));
    EXPECT_EQ(merged({{"key", combination}}), result)
        << combination.inMemory.value_or(0) << combination.original.value_or(0)
        << combination.onDisk.value_or(0);
  }
}

TEST(ThreeWayMerge, KeysDoNotInfluenceEachOther) {
  // One key before the common one and one behind it.
  for (const Combination& first : allCombinations()) {
    for (const Combination& second : allCombinations()) {
      PropertyDictionary result = {{"common", 0}};
      put(result, "a", expected(first));
      put(result, "z", expected(second));
      ASSERT_EQ(merged({{"a", first}, {"z", second}}), result);
    }
  }
}

TEST(ThreeWayMerge, MemoryWinsWholeWithoutAnOriginal) {
  EXPECT_EQ(mergeThreeWays({{"a", 1}}, {}, {{"b", 2}}), (PropertyDictionary{{"a", 1}}));
}

TEST(ThreeWayMerge, MemoryWinsWholeWithoutAnythingOnDisk) {
  EXPECT_EQ(mergeThreeWays({{"a", 1}}, {{"a", 1}, {"b", 2}}, {}), (PropertyDictionary{{"a", 1}}));
}

TEST(ThreeWayMerge, AnEmptyMemoryDeletesWhatTheOriginalHad) {
  EXPECT_EQ(mergeThreeWays({}, {{"a", 1}}, {{"a", 2}, {"b", 2}}), (PropertyDictionary{{"b", 2}}));
}

TEST(ThreeWayMerge, ANestedValueIsTakenWholeFromMemoryWhenItChangedThere) {
  const PropertyDictionary original = {{"list", PropertyArray{"x"}}};
  const PropertyDictionary inMemory = {{"list", PropertyArray{"x", "from memory"}}};
  const PropertyDictionary onDisk = {{"list", PropertyArray{"x", "from disk"}}};
  EXPECT_EQ(mergeThreeWays(inMemory, original, onDisk), inMemory);
}

TEST(ThreeWayMerge, ANestedValueIsTakenWholeFromTheDiskWhenItDidNotChangeInMemory) {
  const PropertyDictionary original = {{"list", PropertyArray{"x"}}, {"changed", 1}};
  const PropertyDictionary inMemory = {{"list", PropertyArray{"x"}}, {"changed", 2}};
  const PropertyDictionary onDisk = {{"list", PropertyArray{"from disk"}}, {"changed", 1}};
  EXPECT_EQ(mergeThreeWays(inMemory, original, onDisk),
            (PropertyDictionary{{"list", PropertyArray{"from disk"}}, {"changed", 2}}));
}

TEST(ThreeWayMerge, AnotherKindOfValueIsAChange) {
  EXPECT_EQ(mergeThreeWays({{"a", true}}, {{"a", 1}}, {{"a", 1}}),
            (PropertyDictionary{{"a", true}}));
}

TEST(ThreeWayMerge, WithoutAChangeInMemoryTheDisksDictionaryIsUsedAsItIs) {
  const PropertyDictionary onDisk = {{"a", 2}, {"b", 3}};
  EXPECT_TRUE(mergeThreeWays({{"a", 1}}, {{"a", 1}}, onDisk).isSameAs(onDisk));
}

TEST(ThreeWayMerge, WithoutAChangeOnDiskMemorysDictionaryIsUsedAsItIs) {
  const PropertyDictionary original = {{"a", 1}, {"b", 2}};
  const PropertyDictionary inMemory = {{"a", 2}, {"c", 3}};
  EXPECT_TRUE(mergeThreeWays(inMemory, original, original).isSameAs(inMemory));
}

TEST(ThreeWayMerge, WhereDiskAndMemoryShareADictionaryItIsUsedAsItIs) {
  const PropertyDictionary both = {{"a", 2}, {"c", 3}};
  EXPECT_TRUE(mergeThreeWays(both, {{"a", 1}, {"b", 2}}, both).isSameAs(both));
}

}  // namespace
}  // namespace accounts
