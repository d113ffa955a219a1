#include <gtest/gtest.h>

#include <regex>

#include "platform/linux/LinuxUUIDGenerator.h"

namespace accounts {
namespace {

TEST(UUIDGeneratorTest, AUUIDIsRandomUpperCaseAndGrouped) {
  const auto uuid = LinuxUUIDGenerator().randomUUID();
  ASSERT_TRUE(uuid);
  // The 4 says "random", the group after it begins with the variant.
  const std::regex form("[0-9A-F]{8}-[0-9A-F]{4}-4[0-9A-F]{3}-[89AB][0-9A-F]{3}-[0-9A-F]{12}");
  EXPECT_TRUE(std::regex_match(*uuid, form)) << *uuid;
}

TEST(UUIDGeneratorTest, EachUUIDIsAFreshOne) {
  LinuxUUIDGenerator generator;
  EXPECT_NE(generator.randomUUID(), generator.randomUUID());
}

}  // namespace
}  // namespace accounts
