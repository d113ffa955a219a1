#include "bench/NumberSequence.h"

#include <string_view>

namespace accounts {

// SplitMix64: any two seeds, also consecutive ones, give unrelated sequences.
std::uint64_t NumberSequence::next() {
  state_ += 0x9e3779b97f4a7c15;
  std::uint64_t mixed = state_;
  mixed = (mixed ^ (mixed >> 30)) * 0xbf58476d1ce4e5b9;
  mixed = (mixed ^ (mixed >> 27)) * 0x94d049bb133111eb;
  return mixed ^ (mixed >> 31);
}

std::string NumberSequence::bytes(std::size_t count) {
  std::string text;
  text.reserve(count);
  while (text.size() < count) {
    text += static_cast<char>(next() >> 56);
  }
  return text;
}

std::string NumberSequence::identifier() {
  constexpr std::string_view kDigits = "0123456789ABCDEF";
  constexpr std::string_view kPattern = "xxxxxxxx-xxxx-4xxx-8xxx-xxxxxxxxxxxx";
  std::string text(kPattern);
  for (char& character : text) {
    if (character == 'x') {
      character = kDigits[next() >> 60];
    }
  }
  return text;
}

}  // namespace accounts
