#pragma once

#include <optional>
#include <string>
#include <string_view>

#include "accountsctl/JSONText.h"
#include "accountsctl/StoreDifference.h"
#include "commandline/Terminal.h"

namespace accounts {

/// A difference in lines for people; none for none.
std::string differenceText(const StoreDifference& difference, const StoreLayout& layout,
                           const Terminal& terminal);

/// A difference as an object for programs.
JSON differenceObject(const StoreDifference& difference, const StoreLayout& layout);

}  // namespace accounts
