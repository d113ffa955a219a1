#include "host/RootLock.h"

#include <fcntl.h>
#include <sys/file.h>

#include <cerrno>

namespace accounts {

std::optional<RootLock> RootLock::take(const DeviceRoot& root, PathError& error) {
  auto directory = root.open("/", O_RDONLY | O_DIRECTORY, error);
  if (!directory) {
    return std::nullopt;
  }
  while (::flock(directory->number(), LOCK_EX) != 0) {
    if (errno != EINTR) {
      error = pathError("lock", "the device root", errno);
      return std::nullopt;
    }
  }
  return RootLock(std::move(*directory));
}

RootLock::~RootLock() {
  // Not left to closing: a process that a plug-in left behind has the directory open too. After a
  // move there is nothing to unlock, and that fails without harm.
  ::flock(directory_.number(), LOCK_UN);
}

}  // namespace accounts
