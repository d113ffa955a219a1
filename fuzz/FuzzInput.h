#pragma once

#include <algorithm>
#include <cstddef>
#include <cstdint>
#include <string_view>

namespace accounts {

/// The bytes of a fuzzing input as a sequence of choices. An input that is used up goes on giving
/// zeros, so every input makes something, and a choice's first alternative ought to be the one that
/// ends soonest.
class FuzzInput {
 public:
  explicit FuzzInput(std::string_view bytes) : bytes_(bytes) {}

  [[nodiscard]] bool isUsedUp() const { return bytes_.empty(); }

  std::uint8_t byte() {
    const std::string_view next = bytes(1);
    return next.empty() ? 0 : static_cast<std::uint8_t>(next.front());
  }
  /// A number below `count`, which must be from 1 to 256.
  std::size_t below(std::size_t count) { return byte() % count; }
  /// True once in 256 random inputs, for what is to be rare.
  bool seldom() { return byte() == 0xff; }
  bool flag() { return (byte() & 1) != 0; }

  /// A number of eight bytes, the lowest first.
  std::uint64_t number() {
    std::uint64_t result = 0;
    for (int shift = 0; shift < 64; shift += 8) {
      result |= std::uint64_t{byte()} << shift;
    }
    return result;
  }
  /// As many bytes as there are, up to `count`.
  std::string_view bytes(std::size_t count) {
    const std::string_view result = bytes_.substr(0, count);
    bytes_.remove_prefix(result.size());
    return result;
  }
  /// Bytes preceded by their count in two bytes, the lower first.
  std::string_view countedBytes() {
    const std::size_t low = byte();
    return bytes(low | std::size_t{byte()} << 8);
  }

 private:
  std::string_view bytes_;
};

}  // namespace accounts
