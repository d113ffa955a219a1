#include "propertylist/value/KeyedHash.h"

#include <chrono>

namespace accounts {

KeyedHash::KeyedHash() {
  // Where this object stands in memory and the time of the call: nobody who prepares a file knows
  // either. Odd, because a factor of 0 would hash everything to 0.
  constexpr std::uint64_t kMixer = 0xD1B54A32D192ED03;
  const auto address = static_cast<std::uint64_t>(reinterpret_cast<std::uintptr_t>(this));
  const auto time =
      static_cast<std::uint64_t>(std::chrono::steady_clock::now().time_since_epoch().count());
  first_ = fold(address ^ kMixer, time | 1) | 1;
  second_ = fold(time ^ kMixer, first_ ^ kMixer) | 1;
}

}  // namespace accounts
