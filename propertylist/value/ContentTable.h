#pragma once

#include <cstddef>
#include <cstdint>
#include <vector>

/// The tables by which readers, writers and indexes find what they have met already. Nothing that
/// can be seen depends on the order in them.
namespace accounts {

inline constexpr std::size_t kInitialSlotCount = 256;

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
