#pragma once

#include <optional>
#include <string>
#include <vector>

#include "propertylist/value/PropertyValue.h"
#include "propertylist/value/SecretKeys.h"

namespace accounts {

/// A property that two dictionaries do not have alike. At least one of the values is there.
struct PropertyChange {
  /// The keys that lead to the value, joined by "/".
  std::string path;
  std::optional<PropertyValue> before;
  std::optional<PropertyValue> after;
};

/// How two dictionaries differ, in the order of their keys. Dictionaries that both have under a key
/// are compared in turn; anything else is one value. A value under a key of a secret differs as a
/// whole, and is `kHiddenValue` if secrets are to be hidden, as are secrets within other values.
std::vector<PropertyChange> propertyChanges(const PropertyDictionary& before,
                                            const PropertyDictionary& after, Secrets secrets);

}  // namespace accounts
