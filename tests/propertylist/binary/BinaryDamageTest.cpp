#include <gtest/gtest.h>

#include <memory>
#include <string>

#include "tests/propertylist/PropertyListTesting.h"

namespace accounts {
namespace {

/// A file of every kind with a dictionary for each of its reference lists, small enough to be
/// damaged at every byte.
std::string smallFile() {
  using namespace std::string_literals;
  return writeBinary(PropertyDictionary{
      {"array", PropertyArray{1, 300, 70'000, -1, ~std::uint64_t{0}, PropertyArray{}}},
      {"boolean", true},
      {"data", PropertyData("\x00\xFF"s)},
      {"date", PropertyDate{3.5e8}},
      {"dictionary", PropertyDictionary{{"a", false}, {"b", PropertyDictionary{}}}},
      {"long text", std::string(40, 'x')},
      {"real", 0.5},
      {"unicode", "B\xC3\xBCro"}});
}

/// Reads from memory that ends where the bytes end, so that a sanitizer sees every byte read beyond
/// them.
bool isReadable(std::string_view bytes) {
  const auto exact = std::make_unique<char[]>(bytes.size());
  bytes.copy(exact.get(), bytes.size());
  const auto value = readBinaryPropertyList(std::string_view(exact.get(), bytes.size()));
  EXPECT_TRUE(value || !value.error().text.empty());
  return value.has_value();
}

TEST(DamagedBinaryFile, AFileCutOffAtAnyLengthIsRefused) {
  const std::string file = smallFile();
  ASSERT_TRUE(isReadable(file));

  for (std::size_t length = 0; length < file.size(); ++length) {
    EXPECT_FALSE(isReadable(std::string_view(file).substr(0, length))) << length;
  }
}

TEST(DamagedBinaryFile, AnyBitOrByteFlippedIsReadOrRefusedButNeverCrashes) {
  const std::string file = smallFile();
  std::size_t refusedCount = 0;

  for (std::size_t position = 0; position < file.size(); ++position) {
    for (const int change : {1, 2, 4, 8, 16, 32, 64, 128, 255}) {
      std::string damaged = file;
      damaged[position] = static_cast<char>(damaged[position] ^ change);
      refusedCount += isReadable(damaged) ? 0 : 1;
    }
  }

  // Some changes give another valid file, in the middle of a text for instance; most do not.
  EXPECT_GT(refusedCount, file.size() * 9 / 4);
}

TEST(DamagedBinaryFile, WhatADamagedFileStillGivesCanBeWrittenAndReadAgain) {
  const std::string file = smallFile();

  for (std::size_t position = 8; position < file.size(); ++position) {
    std::string damaged = file;
    damaged[position] = static_cast<char>(damaged[position] ^ 1);
    if (const auto value = readBinaryPropertyList(damaged)) {
      EXPECT_EQ(readBinary(writeBinary(*value)), *value);
    }
  }
}

}  // namespace
}  // namespace accounts
