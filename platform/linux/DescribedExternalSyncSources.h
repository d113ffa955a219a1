#pragma once

#include "platform/ExternalSyncSources.h"
#include "platform/linux/DeviceDescription.h"

namespace accounts {

/// Answers from a device description, which must outlive this.
class DescribedExternalSyncSources final : public ExternalSyncSources {
 public:
  explicit DescribedExternalSyncSources(const DeviceDescription& description)
      : description_(description) {}

  ExternalSyncSourcesAnswer copyEnabledSources(SyncDataType dataType) override;

 private:
  const DeviceDescription& description_;
};

}  // namespace accounts
