#include "commandline/MemoryReserve.h"

#include <gtest/gtest.h>
#include <sys/resource.h>

#include <cstdlib>
#include <fstream>
#include <memory>
#include <new>
#include <vector>

#include "commandline/WorkerLimits.h"
#include "tests/fakes/Sanitizers.h"

namespace accounts {
namespace {

constexpr std::size_t kBlock = 100'000;
using Blocks = std::vector<std::unique_ptr<char[]>>;

/// Lets this process have little more memory than it has.
void limitMemory() {
  std::size_t pages = 0;
  std::ifstream("/proc/self/statm") >> pages;
  const rlimit limit = {.rlim_cur = pages * 4096 + 8 * kMebibyte, .rlim_max = RLIM_INFINITY};
  if (setrlimit(RLIMIT_AS, &limit) != 0) {
    std::abort();
  }
}

bool isUntouched() {
  try {
    MemoryReserve::requireUntouched();
    return true;
  } catch (const std::bad_alloc&) {
    return false;
  }
}

/// Takes memory until the reserve is touched. Throws if there is none before that.
Blocks takeAllOthersHave() {
  Blocks blocks;
  blocks.reserve(10'000);
  while (isUntouched()) {
    blocks.push_back(std::make_unique<char[]>(kBlock));
  }
  return blocks;
}

TEST(MemoryReserveTest, IsUntouchedAsLongAsThereIsMemory) {
  const MemoryReserve reserve;
  const auto block = std::make_unique<char[]>(kMebibyte);

  EXPECT_TRUE(isUntouched());
}

TEST(MemoryReserveTest, WithoutOneNothingMayBegin) {
  EXPECT_FALSE(isUntouched());
}

TEST(MemoryReserveDeathTest, IsGivenToWhoeverFindsNoMemoryAndLetsWhatWasBegunEnd) {
  if (kWithSanitizers) {
    GTEST_SKIP() << "Sanitizers take address space without end.";
  }
  const auto endWithTheReserve = [] {
    const MemoryReserve reserve;
    limitMemory();
    Blocks blocks = takeAllOthersHave();
    // The last block was the first of the reserve; half of it is left at least.
    for (std::size_t taken = 0; taken < kMebibyte / 2; taken += kBlock) {
      blocks.push_back(std::make_unique<char[]>(kBlock));
    }
    std::_Exit(EXIT_SUCCESS);
  };
  EXPECT_EXIT(endWithTheReserve(), testing::ExitedWithCode(EXIT_SUCCESS), "");
}

TEST(MemoryReserveDeathTest, ComesToAnEnd) {
  if (kWithSanitizers) {
    GTEST_SKIP() << "Sanitizers take address space without end.";
  }
  const auto takeMoreThanThereIs = [] {
    const MemoryReserve reserve;
    limitMemory();
    Blocks blocks = takeAllOthersHave();
    try {
      for (std::size_t taken = 0; taken < 2 * kMebibyte; taken += kBlock) {
        blocks.push_back(std::make_unique<char[]>(kBlock));
      }
    } catch (const std::bad_alloc&) {
      std::_Exit(EXIT_SUCCESS);
    }
    std::_Exit(EXIT_FAILURE);
  };
  EXPECT_EXIT(takeMoreThanThereIs(), testing::ExitedWithCode(EXIT_SUCCESS), "");
}

}  // namespace
}  // namespace accounts
