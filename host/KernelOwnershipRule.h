#pragma once

#include <string>
#include <string_view>

#include "platform/linux/DeviceRoot.h"
#include "platform/linux/OwnerNames.h"
#include "transaction/TransactionFileSystem.h"

namespace accounts {

/// The kernel's rule: a privileged process gives files to anybody, another one only to itself. The
/// names are those of the device.
class KernelOwnershipRule final : public OwnershipRule {
 public:
  /// The process is judged as it is now. `root` must outlive this.
  explicit KernelOwnershipRule(const DeviceRoot& root);

  /// Opens now what tells who `name` is; no other name is known afterwards.
  void readAhead(const std::string& name) { names_.readAhead(name); }

  OrFailure<FileOwner> ownerNamed(std::string_view ownerName, std::string_view groupName) override;

 private:
  OwnerNames names_;
  const FileOwner self_;
};

}  // namespace accounts
