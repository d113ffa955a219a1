#include "platform/linux/LinuxSharedResources.h"

#include <fcntl.h>
#include <sys/file.h>
#include <sys/stat.h>

#include <cerrno>
#include <chrono>
#include <optional>
#include <thread>
#include <utility>

#include "platform/linux/FileDescriptor.h"
#include "vocabulary/DevicePath.h"

namespace accounts {
namespace {

// Processes of other users wait on the lock too. Keeping them from opening the file would keep
// nobody from holding the lock up, since anyone may make a file in the directory first.
constexpr mode_t kLockFilePermissions = 0644;

// Waited before asking again when the kernel is out of memory for locks, which passes.
constexpr std::chrono::milliseconds kPauseBeforeRetry(100);

class FileLock final : public NamedLock {
 public:
  explicit FileLock(FileDescriptor file) : file_(std::move(file)) {}

  void lock() override {
    while (::flock(file_.number(), LOCK_EX) != 0) {
      if (errno != EINTR) {
        std::this_thread::sleep_for(kPauseBeforeRetry);
      }
    }
  }

  void unlock() override { ::flock(file_.number(), LOCK_UN); }

 private:
  FileDescriptor file_;
};

// Opened for writing where that is allowed: some network file systems lock no other files. Never
// with O_CREAT where the file exists: the kernel can refuse that in a directory such as /tmp when
// the file is another user's.
std::optional<FileDescriptor> openExisting(const DirectoryEntry& entry, Failure& error) {
  auto file = entry.openRegularFile(O_RDWR, error);
  return file || error.number == ENOENT ? std::move(file) : entry.openRegularFile(O_RDONLY, error);
}

std::optional<FileDescriptor> openOrCreate(const DirectoryEntry& entry, Failure& error) {
  auto file = openExisting(entry, error);
  if (file || error.number != ENOENT) {
    return file;
  }
  file = entry.createFile(kLockFilePermissions, error);
  if (file) {
    ::fchmod(file->number(), kLockFilePermissions);
    return file;
  }
  // Another process may have made it meanwhile.
  return error.number == EEXIST ? openExisting(entry, error) : std::nullopt;
}

bool canBeLocked(const FileDescriptor& file) {
  if (::flock(file.number(), LOCK_EX | LOCK_NB) == 0) {
    ::flock(file.number(), LOCK_UN);
    return true;
  }
  return errno == EWOULDBLOCK || errno == EINTR || errno == ENOLCK;
}

}  // namespace

std::optional<FileDescriptor> openLockFile(const DeviceRoot& root, std::string_view name,
                                           Failure& error) {
  const auto entry = root.locate(joinedPath(kLockDirectory, name), error);
  return entry ? openOrCreate(*entry, error) : std::nullopt;
}

std::string LinuxSharedResources::systemRootDirectory() {
  return "/";
}

std::string LinuxSharedResources::sharedResourcesDirectory() {
  return "/var/mobile";
}

std::unique_ptr<NamedLock> LinuxSharedResources::makeLock(std::string_view name) {
  if (name.find('/') != std::string_view::npos) {
    return nullptr;
  }
  Failure error;
  auto file = openLockFile(root_, name, error);
  if (!file || !canBeLocked(*file)) {
    return nullptr;
  }
  return std::make_unique<FileLock>(std::move(*file));
}

}  // namespace accounts
