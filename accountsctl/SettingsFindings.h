#pragma once

#include <vector>

#include "accountsctl/Finding.h"
#include "propertylist/value/PropertyValue.h"

namespace accounts {

/// What a store would drop, repair or ignore of the root of an account settings file, in the order
/// of the file. There must be a current process (accountsettings/Process).
std::vector<Finding> findingsInSettings(const PropertyDictionary& root);

}  // namespace accounts
