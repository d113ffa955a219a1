#pragma once

#include <string>
#include <string_view>

namespace accounts {

/// A text as one word of a command line that a person can paste into a shell: as it stands where
/// the shell takes it so, else between apostrophes.
std::string shellWord(std::string_view text);

}  // namespace accounts
