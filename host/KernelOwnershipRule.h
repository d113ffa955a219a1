#pragma once

#include <string_view>
#include <variant>

#include "platform/linux/DeviceRoot.h"
#include "platform/linux/OwnerNames.h"
#include "transaction/TransactionFileSystem.h"

namespace accounts {

/// The kernel's rule: a privileged process gives files to anybody, another one only to itself. The
/// names are those of the device.
class KernelOwnershipRule final : public OwnershipRule {
 public:
  /// `root` must outlive this.
  explicit KernelOwnershipRule(const DeviceRoot& root) : names_(root) {}

  std::variant<FileOwner, PlaceFailure> ownerNamed(std::string_view ownerName,
                                                   std::string_view groupName) override;

 private:
  OwnerNames names_;
};

}  // namespace accounts
