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

  /// Adds the next key's value, made in its place of what is given, and returns it. There must not
  /// be more of them than keys.
  template <class Source>
  const PropertyValue& append(Source&& source) {
    return values_.run()->append(std::forward<Source>(source));
  }
  /// The dictionary, once each key has its value.
  [[nodiscard]] PropertyDictionary take() { return std::move(values_); }

 private:
  /// One only when it is taken.
  PropertyDictionary values_;
};

}  // namespace accounts
