#pragma once

#include <cstdint>

#include "platform/linux/Confinement.h"

namespace accounts {

/// In bytes.
constexpr std::uint64_t kMebibyte = std::uint64_t{1} << 20;

/// What a worker may use for input files of a size, all together: several times what a migration of
/// any device of that size takes in the slowest build, and an end for what grows without end.
constexpr ProcessLimits workerLimitsFor(std::uint64_t inputSize) {
  constexpr std::uint64_t kMemoryForAnyInput = 256 * kMebibyte;
  constexpr std::uint64_t kMemoryForAByte = 2048;
  constexpr std::uint64_t kSecondsForAnyInput = 5;
  constexpr std::uint64_t kSecondsForAMebibyte = 120;
  return {.memory = kMemoryForAnyInput + inputSize * kMemoryForAByte,
          .processorTime = std::chrono::seconds(kSecondsForAnyInput +
                                                inputSize * kSecondsForAMebibyte / kMebibyte)};
}

}  // namespace accounts
