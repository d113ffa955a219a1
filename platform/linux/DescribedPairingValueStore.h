#pragma once

#include <memory>

#include "platform/PairingValueStore.h"
#include "platform/linux/DeviceDescription.h"

namespace accounts {

/// Answers from a device description, which must outlive this and every connection. Connecting
/// fails when the description has no pairing values at all.
class DescribedPairingValueStore final : public PairingValueStore {
 public:
  explicit DescribedPairingValueStore(const DeviceDescription& description)
      : description_(description) {}

  std::unique_ptr<PairingConnection> connect() override;

 private:
  const DeviceDescription& description_;
};

}  // namespace accounts
