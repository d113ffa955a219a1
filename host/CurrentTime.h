#pragma once

#include <string>

namespace accounts {

/// The time now, as the names of kept folders have it: sortable, in UTC, such as
/// "20260102T030405Z".
std::string currentTimeText();

}  // namespace accounts
