#pragma once

#include <cerrno>

#include "tests/campaign/AllocationFailures.h"
#include "tests/campaign/SimulatedKernel.h"

// The system calls of the Linux platform, as the linker gives them to this program instead of the C
// library's (--wrap): those on the simulated device go to the simulated kernel, all others to the
// real one. So what the campaign tries is the platform itself, not a model of it.

namespace accounts {

/// The kernel when a descriptor is a simulated one, else null.
inline SimulatedKernel* kernelOf(int descriptor) {
  return descriptor >= SimulatedKernel::kFirstDescriptor ? SimulatedKernel::current() : nullptr;
}

/// Gives a simulated call's result the way that system calls do.
template <class Number>
Number given(Number result) {
  if (result < 0) {
    errno = static_cast<int>(-result);
    return -1;
  }
  return result;
}

/// What a call gives: that of the simulated kernel by `simulated`, which gets the kernel, when the
/// descriptor is a simulated one, else that of `real`.
template <class Simulated, class Real>
auto callOn(int descriptor, Simulated simulated, Real real) -> decltype(real()) {
  const AllocationsSucceed whileInTheKernel;
  SimulatedKernel* kernel = kernelOf(descriptor);
  return kernel != nullptr ? given(simulated(*kernel)) : real();
}

}  // namespace accounts
