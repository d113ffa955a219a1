#pragma once

#include <utility>

#include "propertylist/value/PropertyDictionary.h"
#include "propertylist/value/PropertyKeys.h"
#include "propertylist/value/PropertyValue.h"

namespace accounts {

/// The values of a dictionary in the making, of which the keys are known: each keeps its place in
/// memory, in the dictionary that is made of them too.
class OrderedValues {
 public:
  OrderedValues() = default;
  explicit OrderedValues(PropertyKeys keys);

  /// Adds the next key's value, not more of them than there are keys, and returns it in its place.
  const PropertyValue& append(PropertyValue value) {
    return values_.run()->append(std::move(value));
  }
  /// The dictionary, once each key has its value.
  [[nodiscard]] PropertyDictionary take() { return std::move(values_); }

 private:
  /// One only when it is taken.
  PropertyDictionary values_;
};

}  // namespace accounts
