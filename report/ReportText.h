#pragma once

#include <string>

#include "commandline/Terminal.h"
#include "inspection/PropertyListJSON.h"

namespace accounts {

/// A report of a migration (docs/json.md) in lines for people: each stage that changed something
/// with what it changed, then the broadcasts. Errors are no part of it.
std::string reportText(const JSON& report, const Terminal& terminal);

}  // namespace accounts
