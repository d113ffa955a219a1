#pragma once

#include "platform/ProfileRestrictions.h"
#include "platform/linux/DeviceDescription.h"

namespace accounts {

/// Answers from a device description, which must outlive this.
class DescribedProfileRestrictions final : public ProfileRestrictions {
 public:
  explicit DescribedProfileRestrictions(const DeviceDescription& description)
      : description_(description) {}

  RestrictionAnswer answerForFeature(RestrictedFeature feature) override;

 private:
  const DeviceDescription& description_;
};

}  // namespace accounts
