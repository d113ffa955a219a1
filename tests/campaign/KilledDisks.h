#pragma once

#include <cstddef>
#include <limits>
#include <vector>

#include "tests/campaign/Run.h"
#include "tests/campaign/SimulatedDisk.h"

namespace accounts {

/// The disks before calls of a recorded run, from the `first` on, and after the last one: so many
/// at the most. What a killed process did before stays done, so each is what it leaves when it is
/// killed there.
std::vector<SimulatedDisk> disksOf(const SimulatedDisk& before, const Run& run,
                                   std::size_t first = 0,
                                   std::size_t most = std::numeric_limits<std::size_t>::max());

}  // namespace accounts
