#pragma once

#include <string>

namespace accounts {

/// The time now, as the names of kept folders have it: sortable, in UTC, such as
/// "20260102T030405Z".
std::string currentTimeText();

/// The time now as reports have it, in UTC, such as "2026-01-02T03:04:05Z".
std::string currentTimeForReports();

}  // namespace accounts
