#pragma once

#include <memory>
#include <string_view>

#include "platform/SharedResources.h"

namespace accounts {

/// A named lock, held from here to the end of the scope; nothing is held when it cannot be made.
class HeldLock {
 public:
  HeldLock(SharedResources& sharedResources, std::string_view name)
      : lock_(sharedResources.makeLock(name)) {
    if (lock_ != nullptr) {
      lock_->lock();
    }
  }
  // Unlocked rather than destroyed alone: a process that a plug-in left behind has the lock's file
  // open too.
  ~HeldLock() {
    if (lock_ != nullptr) {
      lock_->unlock();
    }
  }
  HeldLock(const HeldLock&) = delete;
  HeldLock& operator=(const HeldLock&) = delete;

  [[nodiscard]] bool isHeld() const { return lock_ != nullptr; }

 private:
  std::unique_ptr<NamedLock> lock_;
};

}  // namespace accounts
