#include "commandline/StackLimit.h"

#include <sys/resource.h>

#include <algorithm>
#include <string>

namespace accounts {
namespace {

/// More than 512 nested containers take in the slowest build.
constexpr rlim_t kNeeded = rlim_t{1} << 20;
constexpr rlim_t kKibibyte = 1024;

}  // namespace

OrProgramError<void> askForStack() {
  rlimit limit = {};
  if (::getrlimit(RLIMIT_STACK, &limit) != 0 || limit.rlim_cur >= kNeeded) {
    return {};
  }
  const rlim_t allowed = limit.rlim_max;
  limit = {.rlim_cur = kNeeded, .rlim_max = std::max(kNeeded, limit.rlim_max)};
  if (::setrlimit(RLIMIT_STACK, &limit) == 0) {
    return {};
  }
  return ProgramError{ExitStatus::TemporaryFailure,
                      "Needs a stack of " + std::to_string(kNeeded / kKibibyte) +
                          " KiB, of which it may have " + std::to_string(allowed / kKibibyte)};
}

}  // namespace accounts
