#pragma once

#include <optional>
#include <string>
#include <string_view>

#include "platform/PropertyLists.h"
#include "platform/linux/DeviceRoot.h"
#include "platform/linux/PathError.h"
#include "propertylist/BinaryPropertyList.h"

namespace accounts {

/// The property-list files beneath a device root, which must outlive this. What was read or written
/// last is remembered with its value: a file that is found to hold it again, as every save finds
/// the file of the save before, is read but not decoded, and a value that was written last is not
/// encoded again.
class LinuxPropertyLists final : public PropertyLists {
 public:
  explicit LinuxPropertyLists(const DeviceRoot& root) : root_(root) {}

  std::optional<PropertyDictionary> readDictionary(std::string_view path) override;
  Result serializeBinary(const PropertyValue& value, std::string_view& bytes) override;

  /// Like `readDictionary`, and says in `error` why there is none: `error.isMissing()` tells a
  /// missing file from an unreadable one.
  std::optional<PropertyDictionary> readDictionary(std::string_view path, PathError& error);

 private:
  const DeviceRoot& root_;
  BinaryPropertyListWriter writer_;
  std::string rememberedBytes_;
  /// The dictionary that the bytes stand for, if they do.
  std::optional<PropertyDictionary> rememberedValue_;
  /// Whether the bytes are of our own making: a file may be written otherwise than we would.
  bool areBytesOurs_ = false;
};

}  // namespace accounts
