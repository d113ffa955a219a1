#include "accountsettings/IdentifierIndex.h"

#include <gtest/gtest.h>

#include <string>

namespace accounts {
namespace {

/// The content in order, such as "A=1 B=2".
std::string contentOf(const IdentifierIndex<int>& index) {
  std::string content;
  for (const auto& [identifier, value] : index.inOrder()) {
    content += content.empty() ? "" : " ";
    content += identifier.string() + "=" + std::to_string(value);
  }
  return content;
}

TEST(IdentifierIndex, AValueIsFoundUnderItsIdentifier) {
  IdentifierIndex<int> index;
  index.set("A", 1);
  ASSERT_NE(index.find("A"), nullptr);
  EXPECT_EQ(*index.find("A"), 1);
  EXPECT_TRUE(index.contains("A"));
}

TEST(IdentifierIndex, AnUnknownIdentifierFindsNothing) {
  IdentifierIndex<int> index;
  index.set("A", 1);
  EXPECT_EQ(index.find("a"), nullptr);
  EXPECT_FALSE(index.contains(""));
}

TEST(IdentifierIndex, TheEmptyTextIsAnIdentifierLikeAnyOther) {
  IdentifierIndex<int> index;
  index.set("", 1);
  EXPECT_TRUE(index.contains(""));
}

TEST(IdentifierIndex, ListingIsInTheOrderInWhichIdentifiersCame) {
  IdentifierIndex<int> index;
  index.set("C", 3);
  index.set("A", 1);
  index.set("B", 2);
  EXPECT_EQ(contentOf(index), "C=3 A=1 B=2");
}

TEST(IdentifierIndex, AReplacedValueKeepsThePlaceOfItsIdentifier) {
  IdentifierIndex<int> index;
  index.set("C", 3);
  index.set("A", 1);
  index.set("C", 30);
  EXPECT_EQ(contentOf(index), "C=30 A=1");
  EXPECT_EQ(index.size(), 2u);
}

TEST(IdentifierIndex, ARemovedIdentifierThatComesBackIsTheLast) {
  IdentifierIndex<int> index;
  index.set("C", 3);
  index.set("A", 1);
  index.remove("C");
  index.set("C", 30);
  EXPECT_EQ(contentOf(index), "A=1 C=30");
}

TEST(IdentifierIndex, NothingIsLeftAfterClearing) {
  IdentifierIndex<int> index;
  index.set("A", 1);
  index.clear();
  EXPECT_EQ(index.size(), 0u);
  EXPECT_EQ(index.find("A"), nullptr);
}

TEST(IdentifierIndex, WhatIsLeftIsFoundHoweverManyOthersWereRemoved) {
  IdentifierIndex<int> index;
  for (int number = 0; number < 1000; ++number) {
    index.set(std::to_string(number), number);
  }
  for (int number = 0; number < 1000; ++number) {
    if (number % 100 != 0) {
      index.remove(std::to_string(number));
    }
  }
  EXPECT_EQ(index.size(), 10u);
  EXPECT_EQ(*index.find("900"), 900);
  EXPECT_EQ(index.find("901"), nullptr);
  EXPECT_EQ(contentOf(index),
            "0=0 100=100 200=200 300=300 400=400 500=500 600=600 700=700 800=800 900=900");
}

TEST(IdentifierIndex, AValueIsChangedInItsPlaceOrBeginsAsADefault) {
  IdentifierIndex<int> index;
  index["A"] += 2;
  index["A"] += 3;
  EXPECT_EQ(contentOf(index), "A=5");
}

TEST(IdentifierIndex, EveryChangeRaisesTheCountOfChanges) {
  IdentifierIndex<int> index;
  std::uint64_t before = index.changeCount();
  const auto hasRisen = [&] { return std::exchange(before, index.changeCount()) < before; };
  index.set("A", 1);
  EXPECT_TRUE(hasRisen());
  index.set("A", 2);
  EXPECT_TRUE(hasRisen());
  index.remove("A");
  EXPECT_TRUE(hasRisen());
  index.clear();
  EXPECT_TRUE(hasRisen());
}

TEST(IdentifierIndex, LookingUpAndRemovingNothingLeaveTheCountOfChanges) {
  IdentifierIndex<int> index;
  index.set("A", 1);
  const std::uint64_t before = index.changeCount();
  (void)index.find("A");
  (void)index.inOrder();
  index.remove("B");
  EXPECT_EQ(index.changeCount(), before);
}

}  // namespace
}  // namespace accounts
