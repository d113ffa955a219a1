#pragma once

#include <memory>
#include <string>
#include <string_view>

#include "platform/SharedResources.h"
#include "platform/linux/DeviceRoot.h"
#include "platform/linux/FileDescriptor.h"
#include "platform/linux/PathFailure.h"

namespace accounts {

/// Where the files of locks are, a device path.
inline constexpr std::string_view kLockDirectory = "/tmp";

/// Opens the file of a named lock, made if missing. A failure when that cannot be done or
/// something else than a regular file is there.
OrFailure<FileDescriptor> openLockFile(const DeviceRoot& root, std::string_view name);

/// Places and locks of the device beneath a root, which must outlive this. The lock NAME is an
/// exclusive flock on the regular file /tmp/NAME. The file is made if missing, never changed and
/// never removed; the kernel frees the lock when its holder dies.
class LinuxSharedResources final : public SharedResources {
 public:
  explicit LinuxSharedResources(const DeviceRoot& root) : root_(root) {}

  std::string systemRootDirectory() override;
  std::string sharedResourcesDirectory() override;
  /// Null also when something else than a regular file stands in the lock file's place, a symbolic
  /// link included, or when its file system has no locks.
  std::unique_ptr<NamedLock> makeLock(std::string_view name) override;

 private:
  const DeviceRoot& root_;
};

}  // namespace accounts
