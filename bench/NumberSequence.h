#pragma once

#include <cstddef>
#include <cstdint>
#include <string>

namespace accounts {

/// A sequence of numbers that look random and are the same for the same seed on every machine,
/// which the standard library's distributions do not promise.
class NumberSequence {
 public:
  explicit NumberSequence(std::uint64_t seed) : state_(seed) {}

  std::uint64_t next();
  /// A number below a limit, which must not be 0.
  std::uint64_t below(std::uint64_t limit) { return next() % limit; }
  std::string bytes(std::size_t count);
  /// A text in the form of an account identifier: upper case, grouped 8-4-4-4-12.
  std::string identifier();

 private:
  std::uint64_t state_;
};

}  // namespace accounts
