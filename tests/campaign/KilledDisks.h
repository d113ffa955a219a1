#pragma once

#include <vector>

#include "tests/campaign/Run.h"
#include "tests/campaign/SimulatedDisk.h"

namespace accounts {

/// The disks before each call of a recorded run and after the last one. What a killed process did
/// before stays done, so each is what it leaves when it is killed there.
std::vector<SimulatedDisk> disksOf(const SimulatedDisk& before, const Run& run);

}  // namespace accounts
