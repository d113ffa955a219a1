#pragma once

#include <optional>
#include <string_view>

#include "platform/DeviceInfoService.h"
#include "platform/linux/DeviceDescription.h"

namespace accounts {

/// Answers from a device description, which must outlive this.
class DescribedDeviceInfoService final : public DeviceInfoService {
 public:
  explicit DescribedDeviceInfoService(const DeviceDescription& description)
      : description_(description) {}

  std::optional<PropertyValue> copyAnswer(std::string_view question) override;

 private:
  const DeviceDescription& description_;
};

}  // namespace accounts
