#include "propertylist/value/GeneralisedUTF8.h"

#include <gtest/gtest.h>

#include <array>
#include <string>

namespace accounts {
namespace {

using namespace std::string_view_literals;

struct Sequence {
  std::string_view bytes;
  char32_t codePoint;
};

TEST(GeneralisedUTF8, TheFirstAndLastSequenceOfEachLengthAreReadAndWritten) {
  constexpr std::array<Sequence, 10> sequences = {{
      {"\0"sv, 0},
      {"\x7F", 0x7F},
      {"\xC2\x80", 0x80},
      {"\xDF\xBF", 0x7FF},
      {"\xE0\xA0\x80", 0x800},
      {"\xEF\xBF\xBF", 0xFFFF},
      {"\xF0\x90\x80\x80", 0x10000},
      {"\xF4\x8F\xBF\xBF", 0x10FFFF},
      // Unpaired surrogates, which plain UTF-8 does not have.
      {"\xED\xA0\x80", 0xD800},
      {"\xED\xBF\xBF", 0xDFFF},
  }};
  for (const Sequence& sequence : sequences) {
    const DecodedCodePoint decoded = decodeCodePoint(sequence.bytes);
    EXPECT_EQ(decoded.value, sequence.codePoint);
    EXPECT_EQ(decoded.length, sequence.bytes.size());

    std::string written;
    appendCodePoint(written, sequence.codePoint);
    EXPECT_EQ(written, sequence.bytes);
  }
}

TEST(GeneralisedUTF8, IllFormedSequencesHaveNoLength) {
  constexpr std::array<std::string_view, 16> sequences = {
      // A continuation first, and beginnings of sequences that there are none of.
      "\x80", "\xC0\x80", "\xC1\xBF", "\xF5\x80\x80\x80", "\xFF",
      // Too short, and with something else in the place of each continuation.
      "\xC2", "\xC2\x41", "\xE1\x80", "\xE1\x41\x80", "\xE1\x80\xC0", "\xF1\x80\x80",
      "\xF1\x41\x80\x80", "\xF1\x80\x41\x80",
      // Longer than need be, and beyond the last code point.
      "\xE0\x9F\xBF", "\xF0\x8F\xBF\xBF", "\xF4\x90\x80\x80"};
  for (const std::string_view sequence : sequences) {
    EXPECT_EQ(decodeCodePoint(sequence).length, 0U) << testing::PrintToString(sequence);
  }
}

TEST(GeneralisedUTF8, ABeginningIsNotCutInTheMiddleOfACodePoint) {
  EXPECT_EQ(wholeCodePoints("aé€", 7), "aé€");
  EXPECT_EQ(wholeCodePoints("aé€", 6), "aé€");
  EXPECT_EQ(wholeCodePoints("aé€", 5), "aé");
  EXPECT_EQ(wholeCodePoints("aé€", 3), "aé");
  EXPECT_EQ(wholeCodePoints("aé€", 2), "a");
  EXPECT_EQ(wholeCodePoints("é", 1), "");
}

TEST(GeneralisedUTF8, SurrogatesAreHighOrLowOrNeither) {
  for (const char32_t codePoint :
       {U'\uD7FF', U'\xD800', U'\xDBFF', U'\xDC00', U'\xDFFF', U'\uE000'}) {
    const bool isHigh = codePoint == 0xD800 || codePoint == 0xDBFF;
    const bool isLow = codePoint == 0xDC00 || codePoint == 0xDFFF;
    EXPECT_EQ(isHighSurrogate(codePoint), isHigh);
    EXPECT_EQ(isLowSurrogate(codePoint), isLow);
    EXPECT_EQ(isSurrogate(codePoint), isHigh || isLow);
  }
}

TEST(GeneralisedUTF8, OneByteAnywhereKeepsATextFromBeingASCII) {
  EXPECT_TRUE(isASCII(""));
  EXPECT_TRUE(isASCII("seventeen letters"));
  for (std::size_t position = 0; position < 17; ++position) {
    std::string text = "seventeen letters";
    text[position] = '\x80';
    EXPECT_FALSE(isASCII(text)) << position;
  }
}

}  // namespace
}  // namespace accounts
