#pragma once

#include <optional>
#include <string_view>

#include "platform/Result.h"
#include "propertylist/value/PropertyValue.h"
#include "propertylist/value/SerializedPropertyList.h"

namespace accounts {

/// Reads property-list files and turns values into the bytes of one.
class PropertyLists {
 public:
  virtual ~PropertyLists() = default;

  /// The dictionary that the file at a device path holds, in the XML or the binary format. None
  /// when the file is missing, unreadable or malformed, or when it holds something else than a
  /// dictionary.
  virtual std::optional<PropertyDictionary> readDictionary(std::string_view path) = 0;

  /// Makes of a value what is written in the binary format; its bytes are made when it is. An
  /// error for a value that no reader would take back (PropertyListLimits.h); a save takes none
  /// without an error for a failure, too.
  virtual OrFailure<SerializedPropertyList> serializeBinary(const PropertyValue& value) = 0;
};

}  // namespace accounts
