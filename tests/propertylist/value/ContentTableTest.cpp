#include "propertylist/value/ContentTable.h"

#include <gtest/gtest.h>

#include "propertylist/value/KeyedHash.h"

namespace accounts {
namespace {

/// Adds a number, which is its own content, under a hash.
void add(ContentTable& table, std::uint32_t hash, std::uint32_t number) {
  const auto isNumber = [&](std::uint32_t candidate) { return candidate == number; };
  EXPECT_EQ(table.findOrAdd(hash, number, isNumber), number);
}

std::uint32_t found(const ContentTable& table, std::uint32_t hash, std::uint32_t number) {
  return table.find(hash, [&](std::uint32_t candidate) { return candidate == number; });
}

TEST(ContentTable, FindsEachOfManyNumbersHoweverOftenItHasGrown) {
  ContentTable table;
  const KeyedHash hash;
  constexpr std::uint32_t kCount = 300'000;
  for (std::uint32_t number = 0; number < kCount; ++number) {
    add(table, hash(std::uint64_t{number}), number);
  }

  for (std::uint32_t number = 0; number < kCount; ++number) {
    ASSERT_EQ(found(table, hash(std::uint64_t{number}), number), number);
  }
  EXPECT_EQ(found(table, hash(std::uint64_t{kCount}), kCount), ContentTable::kNone);
}

TEST(ContentTable, FindsNumbersUnderTheSameHash) {
  ContentTable table;
  for (std::uint32_t number = 0; number < 1000; ++number) {
    add(table, 12345, number);
  }

  for (std::uint32_t number = 0; number < 1000; ++number) {
    ASSERT_EQ(found(table, 12345, number), number);
  }
}

TEST(ContentTable, NumbersThatDoNotFitAtItsEndGoToItsBeginning) {
  ContentTable table;
  for (std::uint32_t number = 0; number < 1000; ++number) {
    add(table, UINT32_MAX, number);
    add(table, 0, 1000 + number);
  }

  for (std::uint32_t number = 0; number < 1000; ++number) {
    ASSERT_EQ(found(table, UINT32_MAX, number), number);
    ASSERT_EQ(found(table, 0, 1000 + number), 1000 + number);
  }
}

}  // namespace
}  // namespace accounts
