#include "propertylist/value/PropertyKeys.h"

#include <gtest/gtest.h>

#include <string>
#include <thread>
#include <vector>

#include "propertylist/value/PropertyValue.h"

namespace accounts {
namespace {

using namespace std::string_view_literals;

PropertyKeys keysOf(const std::vector<Text>& ordered) {
  return PropertyKeys(ordered);
}

PropertyKeys withKey(const PropertyKeys& keys, std::string_view key) {
  return keys.with(key, keys.find(key).index);
}

PropertyKeys withoutKey(const PropertyKeys& keys, std::string_view key) {
  return keys.without(keys.find(key).index);
}

TEST(PropertyKeysSearch, EachKeyIsFoundAtItsIndex) {
  const std::vector<Text> ordered = {"",         "A",         "A\0"sv,     "Identifier",
                                     "Identify", "Identify1", "Identify2", "\xC3\xA4"};
  const PropertyKeys keys = keysOf(ordered);

  for (std::size_t index = 0; index < ordered.size(); ++index) {
    const PropertyKeys::Place place = keys.find(ordered[index]);
    EXPECT_TRUE(place.isThere) << index;
    EXPECT_EQ(place.index, index);
  }
}

TEST(PropertyKeysSearch, AKeyIsFoundWhateverStandsAroundItInMemory) {
  for (const std::string_view key : {"a"sv, "ab"sv, "abc"sv, "abcd"sv, "abcdefghi"sv}) {
    const std::vector<Text> ordered = {Text("A"), Text(key), Text("z")};
    for (const char around : {'\0', 'm', '\xFF'}) {
      const std::string memory = std::string(9, around).append(key).append(9, around);
      const PropertyKeys::Place place =
          keysOf(ordered).find(std::string_view(memory).substr(9, key.size()));
      EXPECT_TRUE(place.isThere) << key;
      EXPECT_EQ(place.index, 1U);
    }
  }
}

TEST(PropertyKeysSearch, ShortKeysStandInTheOrderOfTheirBytes) {
  std::vector<Text> ordered;
  for (const std::string_view first : {"", "A", "B", "\x7F", "\xFE"}) {
    for (const std::string_view second : {"", "\x01", "\x7F", "\x80", "\xFF"}) {
      for (const std::string_view third : {"", "\x01", "\x80", "\xFF"}) {
        ordered.emplace_back(std::string(first).append(second).append(third));
      }
    }
  }
  std::ranges::sort(ordered, {}, [](const Text& each) { return each.string(); });
  ordered.erase(std::ranges::unique(ordered).begin(), ordered.end());
  const PropertyKeys keys = keysOf(ordered);
  for (std::size_t index = 0; index < ordered.size(); ++index) {
    EXPECT_EQ(keys.find(ordered[index]).index, index);
    EXPECT_TRUE(keys.find(ordered[index]).isThere);
  }
}

TEST(PropertyKeysSearch, AKeyThatIsNotThereHasItsPlaceInTheOrder) {
  const PropertyKeys keys = keysOf({"Account", "Accounts1", "Accounts3", "Type"});
  struct Missing {
    std::string_view key;
    std::size_t index;
  };

  for (const auto& [key, index] :
       {Missing{"", 0}, Missing{"Accoun", 0}, Missing{"Accounts", 1}, Missing{"Accounts2", 2},
        Missing{"Accounts4", 3}, Missing{"Accounts1\0"sv, 2}, Missing{"\xFF", 4}}) {
    EXPECT_FALSE(keys.find(key).isThere) << key;
    EXPECT_EQ(keys.find(key).index, index) << key;
  }
  EXPECT_FALSE(PropertyKeys().find("a").isThere);
}

TEST(PropertyKeysChanges, AKeyIsAddedInItsPlaceAndRemovedFromIt) {
  const PropertyKeys keys = keysOf({"a", "c"});

  EXPECT_EQ(withKey(keys, "b"), keysOf({"a", "b", "c"}));
  EXPECT_EQ(withoutKey(keys, "a"), keysOf({"c"}));
  EXPECT_EQ(withKey(PropertyKeys(), "a"), keysOf({"a"}));
  EXPECT_EQ(withoutKey(keysOf({"a"}), "a"), PropertyKeys());
  EXPECT_EQ(keys, keysOf({"a", "c"}));
}

TEST(PropertyKeysChanges, TheSameChangeOfSharedKeysGivesTheSameKeysInMemory) {
  const PropertyKeys keys = keysOf({"a", "c"});
  const PropertyKeys sharing = keys;

  EXPECT_TRUE(withKey(keys, "b").isSameAs(withKey(keys, "b")));
  EXPECT_TRUE(withoutKey(keys, "c").isSameAs(withoutKey(keys, "c")));
}

TEST(PropertyKeysChanges, OtherChangesGiveOtherKeys) {
  const PropertyKeys keys = keysOf({"a", "d"});
  const PropertyKeys sharing = keys;

  EXPECT_EQ(withKey(keys, "b"), keysOf({"a", "b", "d"}));
  EXPECT_EQ(withKey(keys, "c"), keysOf({"a", "c", "d"}));
  EXPECT_EQ(withoutKey(keys, "a"), keysOf({"d"}));
  EXPECT_EQ(withoutKey(keys, "d"), keysOf({"a"}));
}

TEST(PropertyKeysChanges, HoweverManyChangesThereWereTheNextOneIsRight) {
  const PropertyKeys keys = keysOf({"a", "z"});
  const PropertyKeys sharing = keys;

  for (int number = 0; number < 100; ++number) {
    const std::string key = "k" + std::to_string(number);
    EXPECT_EQ(withKey(keys, key), keysOf({"a", Text(key), "z"}));
  }
}

TEST(PropertyKeysChanges, ChangesMayFollowEachOtherWithoutEnd) {
  const PropertyKeys first = keysOf({"a"});
  PropertyKeys keys = first;

  for (int count = 0; count < 1000; ++count) {
    const PropertyKeys shared = keys;
    keys = withKey(keys, "b");
    ASSERT_EQ(keys, keysOf({"a", "b"}));
    const PropertyKeys alsoShared = keys;
    keys = withoutKey(keys, "b");
    ASSERT_EQ(keys, first);
  }
}

TEST(PropertyKeysOfDictionaries, DictionariesThatChangeInTheSameWayGoOnSharingTheirKeys) {
  PropertyDictionary one{{"a", 1}, {"c", 1}};
  PropertyDictionary other = one;

  one.set("b", 1);
  other.set("b", 2);
  one.remove("c");
  other.remove("c");

  EXPECT_TRUE(one.keys().isSameAs(other.keys()));
  EXPECT_EQ(one, (PropertyDictionary{{"a", 1}, {"b", 1}}));
  EXPECT_EQ(other, (PropertyDictionary{{"a", 1}, {"b", 2}}));
}

TEST(PropertyKeysOfDictionaries, AChangeIsNotSeenByDictionariesWithTheSameKeys) {
  const PropertyDictionary unchanged{{"a", 1}, {"c", 1}};
  PropertyDictionary changed = unchanged;

  changed.set("b", 2);
  changed.remove("a");

  EXPECT_EQ(unchanged, (PropertyDictionary{{"a", 1}, {"c", 1}}));
}

TEST(PropertyKeysOfDictionaries, ThreadsMayChangeDictionariesWithTheSameKeys) {
  const PropertyDictionary shared{{"a", 1}, {"z", 1}};
  const auto change = [&shared](int& mistakes) {
    for (int number = 0; number < 200; ++number) {
      const std::string key = "k" + std::to_string(number % 20);
      PropertyDictionary copy = shared;
      copy.set(key, number);
      mistakes += copy == PropertyDictionary{{"a", 1}, {Text(key), number}, {"z", 1}} ? 0 : 1;
    }
  };
  int mistakes = 0;
  int mistakesOfOther = 0;

  std::thread other([&] { change(mistakesOfOther); });
  change(mistakes);
  other.join();

  EXPECT_EQ(mistakes, 0);
  EXPECT_EQ(mistakesOfOther, 0);
}

}  // namespace
}  // namespace accounts
