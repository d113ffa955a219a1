#include "migrator/URLEscaping.h"

#include <gtest/gtest.h>

namespace accounts {
namespace {

TEST(URLEscapingTest, LettersDigitsAndHarmlessMarksStand) {
  const std::string standing =
      "ABCDEFGHIJKLMNOPQRSTUVWXYZabcdefghijklmnopqrstuvwxyz0123456789-_.~!*'();:&=+$,";

  EXPECT_EQ(urlEscapedComponent(standing), standing);
}

TEST(URLEscapingTest, EveryOtherByteOfASCIIIsEscaped) {
  EXPECT_EQ(urlEscapedComponent("@?/%#[]"), "%40%3F%2F%25%23%5B%5D");
  EXPECT_EQ(urlEscapedComponent(" \"<>\\^`{|}"), "%20%22%3C%3E%5C%5E%60%7B%7C%7D");
  EXPECT_EQ(urlEscapedComponent(std::string_view("\0\n\x7F", 3)), "%00%0A%7F");
}

TEST(URLEscapingTest, NonASCIICharactersAreEscapedByteByByteInUpperCase) {
  EXPECT_EQ(urlEscapedComponent("j\u00F6rg"), "j%C3%B6rg");
  EXPECT_EQ(urlEscapedComponent("\U0001F600"), "%F0%9F%98%80");
}

TEST(URLEscapingTest, ABlankAndASlashInAUserName) {
  EXPECT_EQ(urlEscapedComponent("a b"), "a%20b");
  EXPECT_EQ(urlEscapedComponent("a/b"), "a%2Fb");
}

TEST(URLEscapingTest, NothingStaysNothing) {
  EXPECT_EQ(urlEscapedComponent(""), "");
}

}  // namespace
}  // namespace accounts
