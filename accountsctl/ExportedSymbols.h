#pragma once

#include <string>
#include <vector>

namespace accounts {

/// The names of what a loaded library gives to others, sorted. `handle` is dlopen's.
std::vector<std::string> exportedSymbols(void* handle);

}  // namespace accounts
