#pragma once

#include <string>

#include "commandline/Terminal.h"
#include "inspection/StoreDifference.h"

namespace accounts {

/// A difference in lines for people; no line for none.
std::string differenceText(const StoreDifference& difference, const StoreLayout& layout,
                           const Terminal& terminal);

}  // namespace accounts
