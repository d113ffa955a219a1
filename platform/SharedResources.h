#pragma once

#include <memory>
#include <string>
#include <string_view>

namespace accounts {

/// A lock that at most one process holds at a time. It is freed when its holder unlocks it,
/// destroys it or dies.
class NamedLock {
 public:
  virtual ~NamedLock() = default;

  /// Takes the lock, waiting without a time limit while another process holds it.
  virtual void lock() = 0;
  virtual void unlock() = 0;
};

/// Places and locks that all processes of the device share.
class SharedResources {
 public:
  virtual ~SharedResources() = default;

  /// The device path of the directory that all system paths start from.
  virtual std::string systemRootDirectory() = 0;
  /// The device path beneath which the shared "Library" directory lies.
  virtual std::string sharedResourcesDirectory() = 0;
  /// Makes the lock object of a name, not yet locked; null when its file cannot be opened or
  /// created.
  virtual std::unique_ptr<NamedLock> makeLock(std::string_view name) = 0;
};

}  // namespace accounts
