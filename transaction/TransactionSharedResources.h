#pragma once

#include <cstdint>
#include <memory>
#include <string>
#include <string_view>

#include "platform/SharedResources.h"
#include "vocabulary/DevicePlaces.h"

namespace accounts {

/// Whether there is a migration lock.
enum class MigrationLockState : std::uint8_t {
  /// It is held for the migration, or nobody will take it before a plan is over.
  Available,
  /// No lock can be made.
  Impossible
};

/// The shared places of a device for a migration in memory: whoever commits it holds the lock.
class TransactionSharedResources final : public SharedResources {
 public:
  /// `beneath` must outlive this.
  TransactionSharedResources(SharedResources& beneath, MigrationLockState lock)
      : beneath_(beneath), lock_(lock) {}

  std::string systemRootDirectory() override { return beneath_.systemRootDirectory(); }
  std::string sharedResourcesDirectory() override { return beneath_.sharedResourcesDirectory(); }
  /// Null for any other lock than the migration's.
  std::unique_ptr<NamedLock> makeLock(std::string_view name) override {
    const bool isAvailable = lock_ == MigrationLockState::Available && name == kMigrationLockName;
    return isAvailable ? std::make_unique<HeldElsewhere>() : nullptr;
  }

 private:
  class HeldElsewhere final : public NamedLock {
   public:
    void lock() override {}
    void unlock() override {}
  };

  SharedResources& beneath_;
  const MigrationLockState lock_;
};

}  // namespace accounts
