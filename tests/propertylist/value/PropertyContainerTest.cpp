#include <gtest/gtest.h>

#include <string>
#include <vector>

#include "propertylist/value/PropertyValue.h"

namespace accounts {
namespace {

std::vector<std::string> keysOf(const PropertyDictionary& dictionary) {
  std::vector<std::string> keys;
  for (const PropertyEntry& entry : dictionary) {
    keys.push_back(entry.key.string());
  }
  return keys;
}

TEST(PropertyDictionaryOperations, EntriesStandInTheOrderOfTheKeysBytes) {
  const PropertyDictionary dictionary{{"b", 1}, {"\xC3\xA4", 2}, {"a", 3},
                                      {"B", 4}, {"", 5},         {"ab", 6}};

  EXPECT_EQ(keysOf(dictionary), (std::vector<std::string>{"", "B", "a", "ab", "b", "\xC3\xA4"}));
}

TEST(PropertyDictionaryOperations, OfEntriesWithTheSameKeyTheLastOneHolds) {
  const PropertyDictionary dictionary{{"a", 1}, {"b", 2}, {"a", 3}, {"a", 4}};

  EXPECT_EQ(dictionary, (PropertyDictionary{{"a", 4}, {"b", 2}}));
}

TEST(PropertyDictionaryOperations, FindGivesTheValueUnderAKeyAndNullForNone) {
  const PropertyDictionary dictionary{{"a", 1}, {"c", 3}};

  ASSERT_NE(dictionary.find("c"), nullptr);
  EXPECT_EQ(*dictionary.find("c"), PropertyValue(3));
  EXPECT_EQ(dictionary.find("b"), nullptr);
  EXPECT_EQ(dictionary.find("d"), nullptr);
  EXPECT_EQ(PropertyDictionary().find("a"), nullptr);
}

TEST(PropertyDictionaryOperations, SetReplacesAValueOrPutsItInItsPlace) {
  PropertyDictionary dictionary{{"a", 1}, {"c", 3}};

  dictionary.set("c", "changed");
  dictionary.set("b", 2);

  EXPECT_EQ(dictionary, (PropertyDictionary{{"a", 1}, {"b", 2}, {"c", "changed"}}));
  EXPECT_EQ(keysOf(dictionary), (std::vector<std::string>{"a", "b", "c"}));
}

TEST(PropertyDictionaryOperations, RemovingAKeyThatIsNotThereChangesNothing) {
  PropertyDictionary dictionary{{"a", 1}};
  const PropertyDictionary before = dictionary;

  dictionary.remove("b");

  EXPECT_TRUE(dictionary.isSameAs(before));
}

TEST(PropertyDictionaryOperations, TakeRemovesAndReturnsTheValue) {
  PropertyDictionary dictionary{{"a", 1}, {"b", 2}};

  EXPECT_EQ(dictionary.take("a"), PropertyValue(1));
  EXPECT_EQ(dictionary.take("a"), std::nullopt);
  EXPECT_EQ(dictionary, (PropertyDictionary{{"b", 2}}));
}

TEST(PropertyDictionaryOperations, AValueOfAnotherKindReadsAsNone) {
  const PropertyDictionary dictionary{
      {"text", "t"}, {"array", PropertyArray{1}}, {"dictionary", PropertyDictionary{{"a", 1}}}};

  EXPECT_EQ(dictionary.textForKey("text"), Text("t"));
  EXPECT_EQ(dictionary.textForKey("array"), std::nullopt);
  EXPECT_EQ(dictionary.textForKey("absent"), std::nullopt);
  EXPECT_EQ(dictionary.arrayForKey("array"), (PropertyArray{1}));
  EXPECT_EQ(dictionary.arrayForKey("text"), std::nullopt);
  EXPECT_EQ(dictionary.dictionaryForKey("dictionary"), (PropertyDictionary{{"a", 1}}));
  EXPECT_EQ(dictionary.dictionaryForKey("array"), std::nullopt);
}

TEST(PropertyArrayOperations, ContainsTextLooksAtTextsOnly) {
  const PropertyArray array{"one", 2, PropertyData("three")};

  EXPECT_TRUE(array.containsText("one"));
  EXPECT_FALSE(array.containsText("2"));
  EXPECT_FALSE(array.containsText("three"));
}

TEST(PropertyArrayOperations, RemoveTextRemovesEveryOccurrenceAndNothingElse) {
  PropertyArray array{"a", 1, "b", "a", PropertyData("a")};

  array.removeText("a");

  EXPECT_EQ(array, (PropertyArray{1, "b", PropertyData("a")}));
}

TEST(PropertyArrayOperations, RemovingATextThatIsNotThereChangesNothing) {
  PropertyArray array{"a", 1};
  const PropertyArray before = array;

  array.removeText("b");

  EXPECT_TRUE(array.isSameAs(before));
}

TEST(PropertyArrayOperations, AppendingAnElementOfTheArrayItselfIsSafe) {
  PropertyArray array{"first"};

  for (int count = 0; count < 20; ++count) {
    array.append(array.at(0));
  }

  EXPECT_EQ(array.size(), 21U);
  EXPECT_EQ(array.at(20), PropertyValue("first"));
}

TEST(PropertyArrayOperations, AnEmptyArrayHasNoElements) {
  const PropertyArray array;

  EXPECT_TRUE(array.empty());
  EXPECT_EQ(array.begin(), array.end());
}

TEST(TextOperations, TextsAreOrderedByTheirBytes) {
  EXPECT_LT(Text("a"), Text("b"));
  EXPECT_LT(Text("Z"), Text("a"));
  EXPECT_LT(Text("z"), Text("\xC3\xA4"));
}

TEST(TextOperations, ATextKeepsEmbeddedNULs) {
  using namespace std::string_view_literals;
  const Text text("a\0b"sv);

  EXPECT_EQ(text.view(), "a\0b"sv);
  EXPECT_FALSE(text == "a");
}

}  // namespace
}  // namespace accounts
