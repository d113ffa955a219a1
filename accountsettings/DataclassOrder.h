#pragma once

#include <string_view>

#include "propertylist/value/PropertyValue.h"

namespace accounts {

// The rules by which lists of dataclasses are ordered, combined and changed. A list comes from a
// file and may be long and hold anything: members that are no texts are no dataclasses. The lists
// that it is compared with come from the configuration and are short.

/// The texts of a list with the dataclasses of `canonicalOrder` first, in that order and once each,
/// then all others in the order of the list, repeated ones included.
PropertyArray orderedDataclasses(const PropertyArray& list, const PropertyArray& canonicalOrder);

/// The members of `allowed`, in its order and once each, that are also in the list.
PropertyArray dataclassesInBoth(const PropertyArray& allowed, const PropertyArray& list);

/// The members of a list that are not in `hidden`.
PropertyArray dataclassesWithout(PropertyArray list, const PropertyArray& hidden);

/// Whether a dataclass is on or off.
enum class DataclassSwitch { Off, On };

/// The list as a set with a dataclass switched on or off: each text once and in its order, a newly
/// switched on one last. Members that are no texts stay.
PropertyArray dataclassSetWith(const PropertyArray& list, std::string_view dataclass,
                               DataclassSwitch state);

}  // namespace accounts
