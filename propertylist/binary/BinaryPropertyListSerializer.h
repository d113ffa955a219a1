#pragma once

#include <cstdint>
#include <optional>
#include <vector>

#include "propertylist/PropertyListError.h"
#include "propertylist/value/PropertyValue.h"
#include "propertylist/value/SerializedPropertyList.h"

namespace accounts {

/// Makes serialised property lists of values that the reader of binary files would take back.
class BinaryPropertyListSerializer {
 public:
  /// A value to be written in the binary format. An error says why for a value that passes one of
  /// the limits in PropertyListLimits.h or holds a text that is not well-formed.
  OrPropertyListError<SerializedPropertyList> serialize(const PropertyValue& value);

 private:
  class Check;
  /// What a part adds to what the limits are for.
  struct Extent {
    std::uint64_t expandedCount = 0;
    /// The most bytes that it can take in a file.
    std::uint64_t size = 0;
  };
  /// A dictionary in an array of the root.
  struct Element {
    const SharedNodeBase* node;
    Extent extent;
  };

  /// What was checked last, kept alive so that its nodes' addresses tell something.
  std::optional<PropertyValue> lastValue_;
  std::vector<Element> lastElements_;
};

}  // namespace accounts
