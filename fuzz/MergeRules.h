#pragma once

#include <map>
#include <optional>
#include <string>

#include "propertylist/value/PropertyValue.h"

namespace accounts {

/// One side of a three-way merge, plainly.
using PlainProperties = std::map<std::string, PropertyValue>;

/// What a three-way merge must give, straight from its rules and without regard to cost: the second
/// opinion against which the real one is fuzzed. An empty `original` or `onDisk` is an absent one.
PlainProperties mergeByTheRules(const PlainProperties& inMemory, const PlainProperties& original,
                                const PlainProperties& onDisk);

/// The same values as a dictionary.
PropertyDictionary dictionaryOf(const PlainProperties& properties);

}  // namespace accounts
