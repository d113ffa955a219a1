#include <gtest/gtest.h>

#include <limits>
#include <optional>
#include <vector>

#include "propertylist/value/PropertyValue.h"
#include "tests/propertylist/PropertyListTesting.h"

namespace accounts {
namespace {

constexpr std::int64_t kLargest = std::numeric_limits<std::int64_t>::max();
constexpr std::int64_t kSmallest = std::numeric_limits<std::int64_t>::min();

struct IntegerReading {
  PropertyValue value;
  std::optional<std::int64_t> integer;
};

void expectIntegers(const std::vector<IntegerReading>& table) {
  for (const IntegerReading& row : table) {
    EXPECT_EQ(row.value.integerValue(), row.integer) << "row " << &row - table.data();
  }
}

TEST(IntegerValue, ANumberGivesItsIntegerPartHeldToTheRange) {
  expectIntegers({{5, 5},
                  {kSmallest, kSmallest},
                  {std::numeric_limits<std::uint64_t>::max(), kLargest},
                  {2.99, 2},
                  {-2.99, -2},
                  {-0.5, 0},
                  {1e300, kLargest},
                  {-1e300, kSmallest},
                  {9223372036854775808.0, kLargest},
                  {-9223372036854775808.0, kSmallest},
                  {kInfinity, kLargest},
                  {-kInfinity, kSmallest},
                  {kNaN, 0}});
}

TEST(IntegerValue, ABooleanGivesZeroOrOne) {
  expectIntegers({{true, 1}, {false, 0}});
}

TEST(IntegerValue, ATextGivesItsLeadingDecimalInteger) {
  expectIntegers({{"12", 12},
                  {" \t\n\v\f\r12", 12},
                  {"-12", -12},
                  {"+12", 12},
                  {"12abc", 12},
                  {"12.9", 12},
                  {"007", 7},
                  {"0x10", 0},
                  {"", 0},
                  {"abc", 0},
                  {"-", 0},
                  {"+-5", 0},
                  {"- 5", 0},
                  {"a12", 0},
                  {"\x01"
                   "12",
                   0}});
}

TEST(IntegerValue, ATextBeyondTheRangeGivesTheNearestEnd) {
  expectIntegers({{"9223372036854775807", kLargest},
                  {"9223372036854775808", kLargest},
                  {"99999999999999999999999999", kLargest},
                  {"-9223372036854775808", kSmallest},
                  {"-9223372036854775809", kSmallest},
                  {"-99999999999999999999999999", kSmallest}});
}

TEST(IntegerValue, OtherKindsHaveNone) {
  expectIntegers({{PropertyDate{5}, std::nullopt},
                  {PropertyData("5"), std::nullopt},
                  {PropertyArray{5}, std::nullopt},
                  {PropertyDictionary{{"5", 5}}, std::nullopt}});
}

struct BooleanReading {
  PropertyValue value;
  std::optional<bool> boolean;
};

void expectBooleans(const std::vector<BooleanReading>& table) {
  for (const BooleanReading& row : table) {
    EXPECT_EQ(row.value.booleanValue(), row.boolean) << "row " << &row - table.data();
  }
}

TEST(BooleanValue, ABooleanIsItself) {
  expectBooleans({{true, true}, {false, false}});
}

TEST(BooleanValue, ANumberIsTrueUnlessZero) {
  expectBooleans({{0, false},
                  {1, true},
                  {-1, true},
                  {std::numeric_limits<std::uint64_t>::max(), true},
                  {0.0, false},
                  {-0.0, false},
                  {0.25, true},
                  {kNaN, true}});
}

TEST(BooleanValue, ATextIsTrueByItsFirstCharacterAfterBlanksASignAndZeros) {
  expectBooleans({{"YES", true},  {"yes", true},  {"y", true},      {"True", true},  {"true", true},
                  {"1", true},    {"9", true},    {"42", true},     {"  yes", true}, {"+1", true},
                  {"-1", true},   {"0001", true}, {"00yes", true},  {" -007", true}, {"-y", true},
                  {"NO", false},  {"no", false},  {"false", false}, {"0", false},    {"000", false},
                  {"", false},    {"-", false},   {"on", false},    {"0 1", false},  {"--1", false},
                  {"0.5", false}, {"a1", false},  {"0-1", false}});
}

TEST(BooleanValue, OtherKindsHaveNone) {
  expectBooleans({{PropertyDate{1}, std::nullopt},
                  {PropertyData("1"), std::nullopt},
                  {PropertyArray{true}, std::nullopt},
                  {PropertyDictionary{{"a", true}}, std::nullopt}});
}

}  // namespace
}  // namespace accounts
