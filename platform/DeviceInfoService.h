#pragma once

#include <optional>
#include <string_view>

#include "propertylist/value/PropertyValue.h"

namespace accounts {

/// Answers questions about the device.
class DeviceInfoService {
 public:
  virtual ~DeviceInfoService() = default;

  /// The answer to a question such as "CPUArchitecture" or "DeviceClass"; none when the device has
  /// no answer.
  virtual std::optional<PropertyValue> copyAnswer(std::string_view question) = 0;
};

}  // namespace accounts
