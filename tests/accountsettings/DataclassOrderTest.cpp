#include "accountsettings/DataclassOrder.h"

#include <gtest/gtest.h>

#include <string>
#include <vector>

#include "tests/accountsettings/TestRecords.h"

// The rules for lists of dataclasses, with letters as dataclasses: A, B and C are canonical.

namespace accounts {
namespace {

const PropertyArray canonical = {"A", "B", "C"};

std::string ordered(const PropertyArray& list) {
  return shortNames(orderedDataclasses(list, canonical));
}

std::string with(const PropertyArray& list, std::string_view dataclass, DataclassSwitch state) {
  return shortNames(dataclassSetWith(list, dataclass, state));
}

TEST(OrderedDataclasses, CanonicalOnesStandInTheirOrderFirst) {
  EXPECT_EQ(ordered({"X", "C", "A"}), "A C X");
}

TEST(OrderedDataclasses, RepeatedCanonicalOnesCollapse) {
  EXPECT_EQ(ordered({"B", "A", "B"}), "A B");
}

TEST(OrderedDataclasses, OthersKeepTheirOrderAndRepetitions) {
  EXPECT_EQ(ordered({"Y", "X", "Y"}), "Y X Y");
}

TEST(OrderedDataclasses, MembersThatAreNoTextsAreNoDataclasses) {
  EXPECT_EQ(ordered({1, "A", PropertyArray{"B"}}), "A");
}

TEST(OrderedDataclasses, AnEmptyListStaysEmpty) {
  EXPECT_EQ(ordered({}), "");
}

TEST(OrderedDataclasses, EveryListOfFourGivesTheSameCanonicalPartInEveryOrder) {
  const std::vector<const char*> letters = {"A", "B", "C", "X"};
  for (unsigned choice = 0; choice < 256; ++choice) {
    PropertyArray list;
    std::string expected;
    for (unsigned place = 0; place < 4; ++place) {
      list.append(letters[(choice >> (2 * place)) & 3U]);
    }
    for (const char* letter : {"A", "B", "C"}) {
      expected += list.containsText(letter) ? letter : "";
    }
    for (const PropertyValue& member : list) {
      expected += *member.asText() == "X" ? "X" : "";
    }
    std::string actual;
    for (const PropertyValue& member : orderedDataclasses(list, canonical)) {
      actual += member.asText()->view();
    }
    EXPECT_EQ(actual, expected) << "from " << shortNames(list);
  }
}

TEST(DataclassesInBoth, TheOrderIsThatOfTheAllowedOnes) {
  EXPECT_EQ(shortNames(dataclassesInBoth({"A", "B", "C"}, {"C", "A"})), "A C");
}

TEST(DataclassesInBoth, RepetitionsOfEitherSideCollapse) {
  EXPECT_EQ(shortNames(dataclassesInBoth({"X", "X", "A"}, {"A", "X", "A"})), "X A");
}

TEST(DataclassesInBoth, MembersThatAreNoTextsNeverMatch) {
  EXPECT_EQ(shortNames(dataclassesInBoth({"A", 1}, {1, "A"})), "A");
}

TEST(DataclassesWithout, HiddenOnesAreTakenOut) {
  EXPECT_EQ(shortNames(dataclassesWithout({"A", "B", "C"}, {"B", "X"})), "A C");
}

TEST(DataclassSet, ANewlySwitchedOnOneStandsLast) {
  EXPECT_EQ(with({"C", "A"}, "B", DataclassSwitch::On), "C A B");
}

TEST(DataclassSet, OneThatIsOnKeepsItsPlace) {
  EXPECT_EQ(with({"C", "A"}, "C", DataclassSwitch::On), "C A");
}

TEST(DataclassSet, EveryOccurrenceOfASwitchedOffOneGoes) {
  EXPECT_EQ(with({"C", "A", "C"}, "C", DataclassSwitch::Off), "A");
}

TEST(DataclassSet, SwitchingOffWhatIsNotOnOnlyMakesTheListASet) {
  EXPECT_EQ(with({"C", "A", "C"}, "B", DataclassSwitch::Off), "C A");
}

TEST(DataclassSet, MembersThatAreNoTextsStay) {
  EXPECT_EQ(with({1, "A", 1}, "A", DataclassSwitch::Off), "1 1");
}

TEST(DataclassesWithout, WhatIsNoTextHidesNothing) {
  EXPECT_EQ(shortNames(dataclassesWithout({"A", "B"}, {1, "A"})), "B");
}

}  // namespace
}  // namespace accounts
