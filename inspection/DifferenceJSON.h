#pragma once

#include "inspection/PropertyListJSON.h"
#include "inspection/StoreDifference.h"

namespace accounts {

/// A difference as an object for programs: what docs/json.md calls a part of a diff.
JSON differenceObject(const StoreDifference& difference, const StoreLayout& layout);

}  // namespace accounts
