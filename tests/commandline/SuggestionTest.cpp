#include "commandline/Suggestion.h"

#include <gtest/gtest.h>

namespace accounts {
namespace {

TEST(Suggestion, AWordIsAtNoDistanceFromItself) {
  EXPECT_EQ(editDistance("show", "show"), 0U);
  EXPECT_EQ(editDistance("", ""), 0U);
}

TEST(Suggestion, EachKindOfMistakeCountsOne) {
  EXPECT_EQ(editDistance("shw", "show"), 1U);
  EXPECT_EQ(editDistance("shoow", "show"), 1U);
  EXPECT_EQ(editDistance("shaw", "show"), 1U);
  EXPECT_EQ(editDistance("shwo", "show"), 1U);
  EXPECT_EQ(editDistance("", "show"), 4U);
}

TEST(Suggestion, TheNearestCandidateIsSuggested) {
  const std::vector<std::string> candidates = {"show", "diff", "status", "convert"};

  EXPECT_EQ(suggestionFor("shwo", candidates), "show");
  EXPECT_EQ(suggestionFor("convret", candidates), "convert");
  EXPECT_EQ(suggestionFor("stats", candidates), "status");
}

TEST(Suggestion, OfTwoThatAreEquallyNearTheFirstIsSuggested) {
  EXPECT_EQ(suggestionFor("abcd", {"abcx", "abcy"}), "abcx");
}

TEST(Suggestion, AWordThatIsLikeNoneHasNoSuggestion) {
  EXPECT_EQ(suggestionFor("migrate", {"show", "diff"}), std::nullopt);
  EXPECT_EQ(suggestionFor("x", {"show"}), std::nullopt);
  EXPECT_EQ(suggestionFor("show", {}), std::nullopt);
}

TEST(Suggestion, AnEndlessWordHasNoSuggestion) {
  const std::string endless(1'000'000, 'x');

  EXPECT_EQ(suggestionFor(endless, {"show"}), std::nullopt);
}

}  // namespace
}  // namespace accounts
