#pragma once

#include <cstdint>
#include <vector>

#include "platform/DeviceSnapshot.h"

namespace accounts {

/// The open files of a snapshot.
struct OpenInputs {
  std::vector<int> descriptors = {};
  /// Bytes, all files together.
  std::uint64_t size = 0;
};

OpenInputs openInputsOf(const DeviceSnapshot& snapshot);

}  // namespace accounts
