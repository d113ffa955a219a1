#include "propertylist/BlockList.h"

#include <gtest/gtest.h>

#include <algorithm>
#include <memory>
#include <numeric>
#include <vector>

namespace accounts {
namespace {

using Numbers = std::vector<NumberRuns::Number>;

constexpr std::size_t kNumbersInABlock = kListBlockSize / sizeof(NumberRuns::Number);

Numbers consecutiveNumbers(NumberRuns::Number first, std::size_t count) {
  Numbers numbers(count);
  std::iota(numbers.begin(), numbers.end(), first);
  return numbers;
}

Numbers read(const NumberRuns& runs, std::size_t place, std::size_t length) {
  const std::span<const NumberRuns::Number> run = runs.run(place, length);
  return {run.begin(), run.end()};
}

TEST(BlockList, KeepsWhatIsAddedInItsOrder) {
  BlockList<std::uint32_t> list;
  const std::size_t count = 3 * kNumbersInABlock + 1;
  for (std::uint32_t number = 0; number < count; ++number) {
    list.emplaceBack(number * 7);
  }

  ASSERT_EQ(list.size(), count);
  for (std::uint32_t number = 0; number < count; ++number) {
    ASSERT_EQ(list[number], number * 7);
  }
}

TEST(BlockList, NothingInItMovesWhenItGrows) {
  BlockList<std::uint32_t> list;
  list.emplaceBack(5U);
  const std::uint32_t* const first = &list[0];
  for (std::size_t count = 0; count < 2 * kNumbersInABlock; ++count) {
    list.emplaceBack(0U);
  }

  EXPECT_EQ(&list[0], first);
  EXPECT_EQ(*first, 5U);
}

TEST(BlockList, LetsGoOfWhatIsInIt) {
  const auto shared = std::make_shared<int>(1);
  {
    BlockList<std::shared_ptr<int>> list;
    for (std::size_t count = 0; count <= kListBlockSize / sizeof(shared); ++count) {
      list.emplaceBack(shared);
    }
    EXPECT_GT(shared.use_count(), 2);
  }

  EXPECT_EQ(shared.use_count(), 1);
}

TEST(NumberRuns, ARunIsFoundByItsPlace) {
  NumberRuns runs;
  const std::size_t first = runs.add(Numbers{1, 2, 3});
  const std::size_t second = runs.add(Numbers{4});

  EXPECT_EQ(read(runs, first, 3), (Numbers{1, 2, 3}));
  EXPECT_EQ(read(runs, second, 1), Numbers{4});
}

TEST(NumberRuns, ARunThatNoLongerFitsIntoABlockStandsInOnePieceInTheNext) {
  NumberRuns runs;
  const Numbers nearlyAll = consecutiveNumbers(0, kNumbersInABlock - 1);
  const std::size_t first = runs.add(nearlyAll);
  const std::size_t second = runs.add(Numbers{1, 2, 3});

  EXPECT_EQ(read(runs, first, nearlyAll.size()), nearlyAll);
  EXPECT_EQ(second, kNumbersInABlock);
  EXPECT_EQ(read(runs, second, 3), (Numbers{1, 2, 3}));
}

TEST(NumberRuns, ARunOfSeveralBlocksStandsInOnePiece) {
  NumberRuns runs;
  const std::size_t before = runs.add(Numbers{1});
  const Numbers large = consecutiveNumbers(7, 2 * kNumbersInABlock + 5);
  const std::size_t place = runs.add(large);
  const std::size_t after = runs.add(Numbers{2, 3});

  EXPECT_EQ(read(runs, before, 1), Numbers{1});
  EXPECT_EQ(read(runs, place, large.size()), large);
  EXPECT_EQ(read(runs, after, 2), (Numbers{2, 3}));
}

TEST(NumberRuns, AnEmptyRunNeedsNoMemory) {
  NumberRuns runs;
  const std::size_t place = runs.add({});

  EXPECT_TRUE(runs.run(place, 0).empty());
}

}  // namespace
}  // namespace accounts
