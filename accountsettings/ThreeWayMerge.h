#pragma once

#include "propertylist/value/PropertyValue.h"

namespace accounts {

/// Applies what memory changed since loading (`inMemory` against `original`) to what the file holds
/// now, key by key; a nested value is taken whole from one side. An empty `original` or `onDisk`
/// stands for an absent one: memory then wins whole.
///
///     in memory, against the original   result
///     new, or another value             memory's value
///     the same value                    the disk's value, or nothing where the disk has none
///     gone                              nothing
///     on neither side                   the disk's value
PropertyDictionary mergeThreeWays(const PropertyDictionary& inMemory,
                                  const PropertyDictionary& original,
                                  const PropertyDictionary& onDisk);

}  // namespace accounts
