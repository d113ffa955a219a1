#pragma once

#include <algorithm>
#include <cstddef>
#include <cstdint>
#include <cstring>
#include <string>
#include <string_view>

namespace accounts {

/// One code point at the beginning of a text, with the number of bytes it takes: 0 when the bytes
/// are no well-formed sequence.
struct DecodedCodePoint {
  char32_t value = 0;
  std::size_t length = 0;
};

constexpr bool isSurrogate(char32_t codePoint) {
  return codePoint >= 0xD800 && codePoint <= 0xDFFF;
}
constexpr bool isHighSurrogate(char32_t codePoint) {
  return codePoint >= 0xD800 && codePoint <= 0xDBFF;
}
constexpr bool isLowSurrogate(char32_t codePoint) {
  return codePoint >= 0xDC00 && codePoint <= 0xDFFF;
}

/// True of what a terminal or an editor may take for a command or for the end of a line, and of the
/// marks that put the text after them in another direction or order, to their end or the line's:
/// with them a text could show itself, and what follows it, as something else. Marks that count as
/// a letter of a direction do no harm and stand in names.
constexpr bool isControlOrReordering(char32_t codePoint) {
  return codePoint < 0x20 || (codePoint >= 0x7F && codePoint < 0xA0) ||
         (codePoint >= 0x2028 && codePoint <= 0x202E) ||
         (codePoint >= 0x2066 && codePoint <= 0x2069);
}

/// Whether every byte is below 0x80. Looks at eight or four at a time, the last of which may be
/// ones that it has seen.
inline bool isASCII(std::string_view text) {
  const auto highBits = [&]<class Word>(Word word, std::size_t place) {
    std::memcpy(&word, text.data() + place, sizeof word);
    return word & static_cast<Word>(0x8080808080808080);
  };
  const std::size_t size = text.size();
  if (size >= 8) {
    std::uint64_t united = highBits(std::uint64_t{}, size - 8);
    for (std::size_t place = 0; place + 8 < size; place += 8) {
      united |= highBits(std::uint64_t{}, place);
    }
    return united == 0;
  }
  if (size >= 4) {
    return (highBits(std::uint32_t{}, 0) | highBits(std::uint32_t{}, size - 4)) == 0;
  }
  return std::all_of(text.begin(), text.end(),
                     [](char character) { return static_cast<signed char>(character) >= 0; });
}

/// Decodes the first code point of a text that is not empty. Generalised UTF-8 is UTF-8 that also
/// knows the three-byte sequences of unpaired surrogates; overlong sequences and values above
/// U+10FFFF are ill-formed in it too.
inline DecodedCodePoint decodeCodePoint(std::string_view text) {
  const auto byteAt = [&](std::size_t index) { return static_cast<unsigned char>(text[index]); };
  const auto isContinuation = [&](std::size_t index) {
    return index < text.size() && (byteAt(index) & 0xC0) == 0x80;
  };
  const char32_t first = byteAt(0);
  if (first < 0x80) {
    return {first, 1};
  }
  if (first >= 0xC2 && first <= 0xDF && isContinuation(1)) {
    return {(first & 0x1F) << 6 | (byteAt(1) & 0x3FU), 2};
  }
  if (first >= 0xE0 && first <= 0xEF && isContinuation(1) && isContinuation(2)) {
    const char32_t value = (first & 0x0F) << 12 | (byteAt(1) & 0x3FU) << 6 | (byteAt(2) & 0x3FU);
    return {value, value >= 0x800 ? 3U : 0U};
  }
  if (first >= 0xF0 && first <= 0xF4 && isContinuation(1) && isContinuation(2) &&
      isContinuation(3)) {
    const char32_t value = (first & 0x07) << 18 | (byteAt(1) & 0x3FU) << 12 |
                           (byteAt(2) & 0x3FU) << 6 | (byteAt(3) & 0x3FU);
    return {value, value >= 0x10000 && value <= 0x10FFFF ? 4U : 0U};
  }
  return {};
}

/// Whether a text is well-formed in it.
inline bool isGeneralisedUTF8(std::string_view text) {
  while (!text.empty()) {
    const std::size_t length = decodeCodePoint(text).length;
    if (length == 0) {
      return false;
    }
    text.remove_prefix(length);
  }
  return true;
}

/// As much of a well-formed text's beginning as is at most `size` bytes long and ends with a code
/// point.
inline std::string_view wholeCodePoints(std::string_view text, std::size_t size) {
  std::size_t end = std::min(size, text.size());
  while (end > 0 && end < text.size() && (static_cast<unsigned char>(text[end]) & 0xC0) == 0x80) {
    --end;
  }
  return text.substr(0, end);
}

/// Appends a code point, surrogates included, as generalised UTF-8.
inline void appendCodePoint(std::string& text, char32_t codePoint) {
  const auto append = [&](char32_t byte) { text.push_back(static_cast<char>(byte)); };
  if (codePoint < 0x80) {
    append(codePoint);
    return;
  }
  if (codePoint < 0x800) {
    append(0xC0 | codePoint >> 6);
  } else {
    if (codePoint < 0x10000) {
      append(0xE0 | codePoint >> 12);
    } else {
      append(0xF0 | codePoint >> 18);
      append(0x80 | (codePoint >> 12 & 0x3F));
    }
    append(0x80 | (codePoint >> 6 & 0x3F));
  }
  append(0x80 | (codePoint & 0x3F));
}

}  // namespace accounts
