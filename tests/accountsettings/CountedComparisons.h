#pragma once

#include <cstdint>

namespace accounts {

#ifdef ACCOUNTS_COUNTS_COMPARISONS
inline constexpr bool kCountsComparisons = true;
#else
inline constexpr bool kCountsComparisons = false;
#endif

/// How many times the store and the values have compared two numbers or pointers since the program
/// began. Only a build whose libraries the fuzz targets use counts: the compiler makes a call of
/// each comparison there.
std::uint64_t comparisonsSoFar();

}  // namespace accounts
