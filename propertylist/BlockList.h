#pragma once

#include <algorithm>
#include <bit>
#include <cstddef>
#include <cstdint>
#include <memory>
#include <new>
#include <span>
#include <utility>
#include <vector>

/// Lists of what may be millions, in blocks: what is in them never moves, nothing is copied while
/// they grow, and a block is all that they have to spare.
namespace accounts {

/// So large that where all blocks begin is always at hand, and yet little for a small file.
inline constexpr std::size_t kListBlockSize = std::size_t{1} << 14;

/// A list that grows at its end.
template <class Element>
class BlockList {
  static_assert(std::has_single_bit(sizeof(Element)), "for divisions that are shifts");

 public:
  BlockList() = default;
  BlockList(const BlockList&) = delete;
  BlockList& operator=(const BlockList&) = delete;
  ~BlockList() {
    for (std::size_t index = 0; index < size_; ++index) {
      std::destroy_at(&(*this)[index]);
    }
  }

  [[nodiscard]] std::size_t size() const { return size_; }
  /// The element with an index, which must be less than the size; it keeps its place in memory.
  [[nodiscard]] const Element& operator[](std::size_t index) const {
    return *std::launder(reinterpret_cast<const Element*>(placeOf(index)));
  }
  [[nodiscard]] Element& operator[](std::size_t index) {
    return const_cast<Element&>(std::as_const(*this)[index]);
  }

  /// Adds an element made of the arguments at the end.
  template <class... Arguments>
  void emplaceBack(Arguments&&... arguments) {
    if (size_ == blocks_.size() * kBlockLength) {
      blocks_.push_back(std::make_unique_for_overwrite<Block>());
    }
    new (const_cast<std::byte*>(placeOf(size_))) Element{std::forward<Arguments>(arguments)...};
    ++size_;
  }

 private:
  static constexpr std::size_t kBlockLength = kListBlockSize / sizeof(Element);
  struct Block {
    alignas(Element) std::byte bytes[kListBlockSize];
  };

  [[nodiscard]] const std::byte* placeOf(std::size_t index) const {
    return blocks_[index / kBlockLength]->bytes + index % kBlockLength * sizeof(Element);
  }

  std::vector<std::unique_ptr<Block>> blocks_;
  std::size_t size_ = 0;
};

/// Runs of numbers. Each stands in one piece of memory, and is known by the place of its first
/// number.
class NumberRuns {
 public:
  using Number = std::uint32_t;

  NumberRuns() = default;
  NumberRuns(const NumberRuns&) = delete;
  NumberRuns& operator=(const NumberRuns&) = delete;

  /// Keeps a copy of a run; returns its place. Places grow a little faster than the count of
  /// numbers: a run that no longer fits into a block leaves its end free.
  std::size_t add(std::span<const Number> run) {
    if (run.empty()) {
      return 0;
    }
    if (run.size() > end_ - next_) {
      const std::size_t count = (run.size() + kBlockLength - 1) / kBlockLength;
      memory_.push_back(std::make_unique_for_overwrite<Number[]>(count * kBlockLength));
      next_ = end_;
      for (std::size_t block = 0; block < count; ++block) {
        blocks_.push_back(memory_.back().get() + block * kBlockLength);
      }
      end_ = blocks_.size() * kBlockLength;
    }
    const std::size_t place = next_;
    std::copy(run.begin(), run.end(), placeOf(place));
    next_ += run.size();
    return place;
  }

  /// A run by its place and its length; valid as long as the runs.
  [[nodiscard]] std::span<const Number> run(std::size_t place, std::size_t length) const {
    return length != 0 ? std::span<const Number>(placeOf(place), length)
                       : std::span<const Number>();
  }

 private:
  static constexpr std::size_t kBlockLength = kListBlockSize / sizeof(Number);

  [[nodiscard]] Number* placeOf(std::size_t place) const {
    return blocks_[place / kBlockLength] + place % kBlockLength;
  }

  std::vector<std::unique_ptr<Number[]>> memory_;
  /// By block: where it begins. A run of several blocks has them one behind the other.
  std::vector<Number*> blocks_;
  std::size_t next_ = 0;
  std::size_t end_ = 0;
};

}  // namespace accounts
