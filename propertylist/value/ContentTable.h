#pragma once

#include <cstddef>
#include <cstdint>
#include <cstring>
#include <string_view>
#include <vector>

/// The tables by which readers, writers and indexes find what they have met already. Nothing that
/// can be seen depends on the order in them.
namespace accounts {

inline constexpr std::size_t kInitialSlotCount = 256;

/// Hashes bytes under a key that differs from object to object, so that nobody can prepare contents
/// that all collide.
class KeyedHash {
 public:
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

/// Finds numbers by the hash of a content that the caller keeps.
class ContentTable {
 public:
  /// No number.
  static constexpr std::uint32_t kNone = UINT32_MAX;

  /// The number under this hash of which `hasContent(number)` is true; `kNone` if there is none.
  template <class HasContent>
  [[nodiscard]] std::uint32_t find(std::uint32_t hash, const HasContent& hasContent) const {
    for (std::size_t place = firstPlace(hash); slots_[place].numberPlusOne != 0;
         place = placeAfter(place)) {
      if (slots_[place].hash == hash && hasContent(slots_[place].numberPlusOne - 1)) {
        return slots_[place].numberPlusOne - 1;
      }
    }
    return kNone;
  }

  /// The number under this hash of which `hasContent(number)` is true. If there is none, adds
  /// `newNumber` and returns it.
  template <class HasContent>
  std::uint32_t findOrAdd(std::uint32_t hash, std::uint32_t newNumber,
                          const HasContent& hasContent) {
    if (4 * (count_ + 1) > 3 * slots_.size()) {
      grow();
    }
    std::size_t place = firstPlace(hash);
    for (; slots_[place].numberPlusOne != 0; place = placeAfter(place)) {
      if (slots_[place].hash == hash && hasContent(slots_[place].numberPlusOne - 1)) {
        return slots_[place].numberPlusOne - 1;
      }
    }
    slots_[place] = {hash, newNumber + 1};
    ++count_;
    return newNumber;
  }

 private:
  struct Slot {
    std::uint32_t hash = 0;
    /// 0 marks a free slot.
    std::uint32_t numberPlusOne = 0;
  };
  /// Where the search for a hash begins. The hash's high bits tell, so that a table that grows is
  /// gone through, old and new, from one end to the other: neither has to fit into a cache.
  [[nodiscard]] std::size_t firstPlace(std::uint32_t hash) const {
    return static_cast<std::size_t>(std::uint64_t{hash} * slots_.size() >> 32);
  }
  [[nodiscard]] std::size_t placeAfter(std::size_t place) const {
    return place + 1 != slots_.size() ? place + 1 : 0;
  }
  void grow();

  std::vector<Slot> slots_ = std::vector<Slot>(kInitialSlotCount);
  std::size_t count_ = 0;
};

}  // namespace accounts
