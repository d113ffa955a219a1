#pragma once

#include "accountsettings/Process.h"
#include "platform/linux/LinuxPlatform.h"
#include "platform/linux/LinuxPreferenceDomain.h"
#include "transaction/TransactionPlatform.h"

namespace accounts {

/// A device as a snapshot has it, and the process of the store's own code on it.
class PlatformInMemory {
 public:
  /// The arguments must outlive this; `observer` may be null.
  PlatformInMemory(LinuxPlatform& linux, Transaction& transaction, MigrationObserver* observer);

  [[nodiscard]] const Platform& platform() const { return platform_; }

 private:
  /// Lets everybody have a file: who looks at an image is not who will migrate it.
  class AnyOwner final : public OwnershipRule {
   public:
    OrFailure<FileOwner> ownerNamed(std::string_view, std::string_view) override {
      return FileOwner();
    }
  };

  class SilentConsole final : public ConsoleLog {
   public:
    void writeLine(std::string_view) override {}
  };

  AnyOwner owners_;
  SilentConsole console_;
  TransactionPlatform inMemory_;
  LinuxPreferenceDomain preferences_;
  Platform platform_;
  Process process_;
};

}  // namespace accounts
