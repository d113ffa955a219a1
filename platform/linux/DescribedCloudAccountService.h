#pragma once

#include <string>

#include "platform/CloudAccountService.h"
#include "platform/linux/DeviceDescription.h"

namespace accounts {

/// Answers from a device description, which must outlive this.
class DescribedCloudAccountService final : public CloudAccountService {
 public:
  explicit DescribedCloudAccountService(const DeviceDescription& description)
      : description_(description) {}

  std::string statusKey() override;
  std::string primaryAccountKey() override;
  std::string accountTypeDisplayName() override;

 private:
  const DeviceDescription& description_;
};

}  // namespace accounts
