#include <gtest/gtest.h>

#include <string>

#include "platform/linux/BytesDigest.h"

namespace accounts {
namespace {

class BytesDigestTest : public ::testing::Test {
 protected:
  void SetUp() override { ASSERT_TRUE(secret); }

  BytesDigest::Value digestOf(std::string_view bytes) {
    BytesDigest digest(*secret);
    digest.add(bytes);
    return digest.value();
  }

  std::optional<DigestSecret> secret = DigestSecret::makeRandom();
};

TEST_F(BytesDigestTest, TheSameBytesHaveTheSameDigest) {
  EXPECT_EQ(digestOf("bytes"), digestOf(std::string("bytes")));
}

TEST_F(BytesDigestTest, InWhichPiecesTheBytesAreAddedMakesNoDifference) {
  const std::string bytes(100'000, 'b');
  BytesDigest digest(*secret);
  for (std::string_view rest = bytes; !rest.empty();) {
    const std::string_view piece = rest.substr(0, 777);
    digest.add(piece);
    rest.remove_prefix(piece.size());
  }
  EXPECT_EQ(digest.value(), digestOf(bytes));
}

TEST_F(BytesDigestTest, OneOtherByteGivesAnotherDigestWhereverItIs) {
  const std::string bytes(5'000, 'b');
  for (std::size_t position = 0; position < bytes.size(); position += 100) {
    std::string changed = bytes;
    changed[position] = 'c';
    EXPECT_NE(digestOf(changed), digestOf(bytes)) << position;
  }
}

TEST_F(BytesDigestTest, MoreBytesGiveAnotherDigestEvenIfTheyAreZeros) {
  EXPECT_NE(digestOf(std::string(1, '\0')), digestOf(""));
  EXPECT_NE(digestOf(std::string(2, '\0')), digestOf(std::string(1, '\0')));
}

TEST_F(BytesDigestTest, UnderAnotherSecretTheDigestIsAnother) {
  const std::string bytes(5'000, 'b');
  const auto ours = digestOf(bytes);
  secret = DigestSecret::makeRandom();
  ASSERT_TRUE(secret);
  EXPECT_NE(digestOf(bytes), ours);
}

}  // namespace
}  // namespace accounts
