#pragma once

#include <optional>
#include <string_view>

#include "platform/Result.h"
#include "propertylist/BytesInPieces.h"
#include "propertylist/PropertyValue.h"

namespace accounts {

/// Reads property-list files and turns values into the bytes of one.
class PropertyLists {
 public:
  virtual ~PropertyLists() = default;

  /// The dictionary that the file at a device path holds, in the XML or the binary format. None
  /// when the file is missing, unreadable or malformed, or when it holds something else than a
  /// dictionary.
  virtual std::optional<PropertyDictionary> readDictionary(std::string_view path) = 0;

  /// Gives the bytes of a value in the binary format, which are valid until the next call of an
  /// operation. Fails, leaving `bytes` empty, for a value that no reader would take back (one
  /// nested too deeply).
  virtual Result serializeBinary(const PropertyValue& value, BytesInPieces& bytes) = 0;
};

}  // namespace accounts
