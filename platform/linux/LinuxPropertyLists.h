#pragma once

#include <optional>
#include <string_view>

#include "platform/PropertyLists.h"
#include "platform/linux/DeviceRoot.h"
#include "propertylist/binary/BinaryPropertyListSerializer.h"

namespace accounts {

/// The property-list files beneath a device root, which must outlive this.
class LinuxPropertyLists final : public PropertyLists {
 public:
  explicit LinuxPropertyLists(const DeviceRoot& root) : root_(root) {}

  std::optional<PropertyDictionary> readDictionary(std::string_view path) override;
  OrFailure<SerializedPropertyList> serializeBinary(const PropertyValue& value) override;

 private:
  const DeviceRoot& root_;
  BinaryPropertyListSerializer serializer_;
};

}  // namespace accounts
