#pragma once

#include <vector>

#include "accountsctl/Finding.h"
#include "propertylist/value/PropertyValue.h"

namespace accounts {

// What a migration would refuse, drop, repair or ignore of a legacy store: each description is
// converted as the migration does it, and loaded as the store does it. A description that cannot be
// converted keeps all accounts of its store from being carried over. There must be a current
// process (accountsettings/Process).

std::vector<Finding> findingsInMailStore(const PropertyDictionary& root);
std::vector<Finding> findingsInExchangeStore(const PropertyDictionary& root);

}  // namespace accounts
