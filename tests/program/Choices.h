#pragma once

#include <cstddef>
#include <cstdint>
#include <iterator>
#include <random>

namespace accounts {

/// Choices that a seed decides: the same seed makes the same ones on every machine.
class Choices {
 public:
  explicit Choices(std::uint64_t seed) : engine_(seed) {}

  /// A number below `count`, which must not be 0.
  std::size_t below(std::size_t count) { return engine_() % count; }
  /// True once in `count` times.
  bool oneIn(std::size_t count) { return below(count) == 0; }
  bool flag() { return oneIn(2); }
  /// One of the elements of an array.
  template <class List>
  const auto& of(const List& list) {
    return list[below(std::size(list))];
  }

 private:
  // Its numbers, unlike those of the standard distributions, are the same everywhere.
  std::mt19937_64 engine_;
};

}  // namespace accounts
