#pragma once

#include "fuzz/FuzzInput.h"
#include "fuzz/FuzzedDevice.h"

namespace accounts {

/// Takes what the services of a device answer, and what an earlier run left there, from an input.
void addServices(FuzzInput& input, FuzzedDevice& device);

}  // namespace accounts
