#pragma once

#include <string_view>
#include <utility>
#include <vector>

#include "propertylist/value/PropertyValue.h"

namespace accounts {

/// The root of a current settings file with the given accounts.
inline PropertyDictionary settings(std::vector<PropertyValue> accountDictionaries) {
  return {{"Version", 12}, {"Accounts", PropertyArray(std::move(accountDictionaries))}};
}

/// A dictionary with one more value.
inline PropertyDictionary with(PropertyDictionary properties, std::string_view key,
                               PropertyValue value) {
  properties.set(key, std::move(value));
  return properties;
}

}  // namespace accounts
