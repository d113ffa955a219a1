#include "tests/accountsettings/CountedComparisons.h"

namespace accounts {
namespace {

std::uint64_t comparisons = 0;

}  // namespace

std::uint64_t comparisonsSoFar() {
  return comparisons;
}

}  // namespace accounts

#ifdef ACCOUNTS_COUNTS_COMPARISONS

// What the compiler calls in the place of the fuzzing engine's own functions.
extern "C" {
void __sanitizer_cov_trace_cmp1(std::uint8_t, std::uint8_t) {
  ++accounts::comparisons;
}
void __sanitizer_cov_trace_cmp2(std::uint16_t, std::uint16_t) {
  ++accounts::comparisons;
}
void __sanitizer_cov_trace_cmp4(std::uint32_t, std::uint32_t) {
  ++accounts::comparisons;
}
void __sanitizer_cov_trace_cmp8(std::uint64_t, std::uint64_t) {
  ++accounts::comparisons;
}
void __sanitizer_cov_trace_const_cmp1(std::uint8_t, std::uint8_t) {
  ++accounts::comparisons;
}
void __sanitizer_cov_trace_const_cmp2(std::uint16_t, std::uint16_t) {
  ++accounts::comparisons;
}
void __sanitizer_cov_trace_const_cmp4(std::uint32_t, std::uint32_t) {
  ++accounts::comparisons;
}
void __sanitizer_cov_trace_const_cmp8(std::uint64_t, std::uint64_t) {
  ++accounts::comparisons;
}
}

#endif
