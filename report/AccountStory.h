#pragma once

#include <optional>
#include <string>
#include <string_view>

#include "inspection/PropertyListJSON.h"

namespace accounts {

/// What a migration did to one account, in a dozen lines for people, each with its line end: where
/// it came from, which stage did what to it and which values changed, and where it is now or why it
/// is not. `report` is that of a plan or a run, `identifier` the account's at any time. None when
/// no account of the report has ever had it; a value that is no report gives none, too.
std::optional<std::string> accountStory(const JSON& report, std::string_view identifier);

}  // namespace accounts
