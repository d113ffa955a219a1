#pragma once

#include <cstddef>
#include <optional>

namespace accounts {

/// Makes the allocation with a number, counted from 0 from here on, fail with std::bad_alloc as
/// long as this is alive; with none, allocations are counted only. One at a time.
class AllocationFailure {
 public:
  explicit AllocationFailure(std::optional<std::size_t> number);
  AllocationFailure(const AllocationFailure&) = delete;
  AllocationFailure& operator=(const AllocationFailure&) = delete;
  ~AllocationFailure();

  /// The number of allocations so far.
  [[nodiscard]] static std::size_t count();
};

/// While one of these is alive, allocations neither fail nor count: they are not the program's own
/// but those of what stands for the world around it.
class AllocationsSucceed {
 public:
  AllocationsSucceed();
  AllocationsSucceed(const AllocationsSucceed&) = delete;
  AllocationsSucceed& operator=(const AllocationsSucceed&) = delete;
  ~AllocationsSucceed();
};

}  // namespace accounts
