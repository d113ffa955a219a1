#include <gtest/gtest.h>

#include <string>

#include "propertylist/value/Text.h"

namespace accounts {
namespace {

TEST(SharedBytes, EveryLengthIsCopiedAndSharedByCopies) {
  for (const std::size_t length : {0U, 1U, 7U, 1000U, 1'000'000U}) {
    std::string bytes(length, 'a');
    const SharedBytes made(bytes);
    const SharedBytes copy = made;
    const std::string before = bytes;
    bytes.assign(length, 'b');

    EXPECT_EQ(copy.view(), before);
    EXPECT_TRUE(copy.isSameAs(made));
  }
}

TEST(SharedBytes, ACopyOutlivesTheFirstHandle) {
  SharedBytes copy;
  {
    const SharedBytes made("content");
    copy = made;
  }
  EXPECT_EQ(copy.view(), "content");
}

}  // namespace
}  // namespace accounts
