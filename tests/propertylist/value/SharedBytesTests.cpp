#include <gtest/gtest.h>

#include <string>
#include <vector>

#include "propertylist/value/Text.h"

namespace accounts {
namespace {

/// Bytes of which each length has its own.
std::string bytesOfLength(std::size_t length) {
  std::string bytes(length, static_cast<char>('a' + length % 26));
  if (length > 0) {
    bytes.back() = '\0';
  }
  return bytes;
}

TEST(SharedBytesArena, WhatItMadeOutlivesIt) {
  std::vector<SharedBytes> made;
  {
    SharedBytesArena arena;
    // Some in its blocks, some too long for one.
    for (std::size_t length = 0; length < 3000; ++length) {
      made.push_back(arena.make(bytesOfLength(length)));
    }
    made.push_back(arena.make(bytesOfLength(1'000'000)));
  }

  for (std::size_t length = 0; length < 3000; ++length) {
    ASSERT_EQ(made[length].view(), bytesOfLength(length));
  }
  EXPECT_EQ(made.back().view(), bytesOfLength(1'000'000));
}

TEST(SharedBytesArena, WhatIsLeftOfABlockStaysWhenTheRestGoes) {
  SharedBytesArena arena;
  std::vector<SharedBytes> kept;
  for (std::size_t count = 0; count < 20'000; ++count) {
    const SharedBytes bytes = arena.make(bytesOfLength(1 + count % 40));
    if (count % 100 == 0) {
      kept.push_back(bytes);
    }
  }

  for (std::size_t index = 0; index < kept.size(); ++index) {
    ASSERT_EQ(kept[index].view(), bytesOfLength(1 + 100 * index % 40));
  }
}

}  // namespace
}  // namespace accounts
