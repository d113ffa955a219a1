#pragma once

#include <cstdint>
#include <span>
#include <vector>

#include "propertylist/value/PropertyKeys.h"
#include "propertylist/value/PropertyValue.h"

namespace accounts {

/// The keys of a dictionary as a file lists them, and what they come to: a reader makes it once for
/// all dictionaries of the file that list the same keys.
class KeyList {
 public:
  /// Takes keys in any order; they need not be different.
  explicit KeyList(std::span<const Text> keys);

  /// The keys in order and once each.
  [[nodiscard]] const PropertyKeys& keys() const { return keys_; }
  /// Whether the file lists them so itself.
  [[nodiscard]] bool isOrdered() const { return sources_.empty(); }
  /// The dictionary of values that are in the order of the file's keys, where the file's keys are
  /// not in order; of values with the same key the last one holds.
  [[nodiscard]] PropertyDictionary dictionaryOf(std::span<const PropertyValue> values) const;

 private:
  PropertyKeys keys_;
  /// For each key the index of its value in the order of the file; empty if that is their order.
  std::vector<std::uint32_t> sources_;
};

}  // namespace accounts
