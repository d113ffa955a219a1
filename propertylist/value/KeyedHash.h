#pragma once

#include <cstddef>
#include <cstdint>
#include <cstring>
#include <string_view>

namespace accounts {

/// Hashes bytes under a key that differs from object to object, so that nobody can prepare contents
/// that all collide.
class KeyedHash {
 public:
  /// Under a new key. Fuzz targets have a definition of their own, with one key for all.
  KeyedHash();

  [[nodiscard]] std::uint32_t operator()(std::string_view bytes) const {
    const char* place = bytes.data();
    const std::size_t size = bytes.size();
    // The size counts too, so that the words at the end may overlap.
    std::uint64_t state = first_ ^ size;
    if (size > 16) {
      for (std::size_t left = size; left > 16; left -= 16, place += 16) {
        state = fold(word<std::uint64_t>(place) ^ second_, word<std::uint64_t>(place + 8) ^ state);
      }
      place = bytes.data() + size;
      state =
          fold(word<std::uint64_t>(place - 16) ^ second_, word<std::uint64_t>(place - 8) ^ state);
    } else if (size >= 8) {
      state =
          fold(word<std::uint64_t>(place) ^ second_, word<std::uint64_t>(place + size - 8) ^ state);
    } else if (size >= 4) {
      state =
          fold(word<std::uint32_t>(place) ^ second_, word<std::uint32_t>(place + size - 4) ^ state);
    } else if (size > 0) {
      const auto byte = [&](std::size_t index) {
        return std::uint64_t{static_cast<unsigned char>(place[index])};
      };
      const std::uint64_t few = byte(0) | byte(size / 2) << 8 | byte(size - 1) << 16;
      state = fold(few ^ second_, state);
    }
    return static_cast<std::uint32_t>(fold(state, first_));
  }

  [[nodiscard]] std::uint32_t operator()(std::uint64_t number) const {
    return static_cast<std::uint32_t>(fold(fold(number ^ first_, second_), first_));
  }

 private:
  template <class Word>
  static std::uint64_t word(const char* place) {
    Word result;
    std::memcpy(&result, place, sizeof result);
    return result;
  }

  /// Both halves of the product, so that every bit of the factors has an effect on the result.
  static std::uint64_t fold(std::uint64_t left, std::uint64_t right) {
    __extension__ using Product = unsigned __int128;
    const Product product = static_cast<Product>(left) * right;
    return static_cast<std::uint64_t>(product) ^ static_cast<std::uint64_t>(product >> 64);
  }

  std::uint64_t first_;
  std::uint64_t second_;
};

}  // namespace accounts
