#pragma once

#include <cstddef>
#include <cstdint>
#include <optional>
#include <vector>

#include "propertylist/PropertyListError.h"
#include "propertylist/PropertyValue.h"
#include "propertylist/SerializedPropertyList.h"

namespace accounts {

/// Makes serialised property lists of values that the reader of binary files would take back.
class BinaryPropertyListSerializer {
 public:
  /// A value to be written in the binary format. None, with `error` saying why, for a value that
  /// passes one of the limits in PropertyListLimits.h or holds a text that is not well-formed.
  SerializedPropertyList serialize(const PropertyValue& value, PropertyListError& error);

 private:
  class Check;
  /// A dictionary in an array of the root, and what it adds to the expanded count.
  struct Element {
    const SharedNodeBase* node;
    std::uint64_t expandedCount;
  };

  /// What was checked last, kept alive so that its nodes' addresses tell something.
  std::optional<PropertyValue> lastValue_;
  std::vector<Element> lastElements_;
};

}  // namespace accounts
