#include "platform/linux/LinuxSharedResources.h"

#include <fcntl.h>
#include <sys/file.h>
#include <sys/stat.h>

#include <cerrno>
#include <chrono>
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
OrFailure<FileDescriptor> openExisting(const DirectoryEntry& entry) {
  auto file = entry.openRegularFile(O_RDWR);
  return file || file.error().number == ENOENT ? std::move(file) : entry.openRegularFile(O_RDONLY);
}

OrFailure<FileDescriptor> openOrCreate(const DirectoryEntry& entry) {
  auto file = openExisting(entry);
  if (file || file.error().number != ENOENT) {
    return file;
  }
  file = entry.createFile(kLockFilePermissions);
  if (file) {
    ::fchmod(file->number(), kLockFilePermissions);
    return file;
  }
  // Another process may have made it meanwhile.
  return file.error().number == EEXIST ? openExisting(entry) : std::move(file);
}

bool canBeLocked(const FileDescriptor& file) {
  if (::flock(file.number(), LOCK_EX | LOCK_NB) == 0) {
    ::flock(file.number(), LOCK_UN);
    return true;
  }
  return errno == EWOULDBLOCK || errno == EINTR || errno == ENOLCK;
}

}  // namespace

OrFailure<FileDescriptor> openLockFile(const DeviceRoot& root, std::string_view name) {
  const auto entry = root.locate(joinedPath(kLockDirectory, name));
  return entry ? openOrCreate(*entry) : entry.error();
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
  auto file = openLockFile(root_, name);
  if (!file || !canBeLocked(*file)) {
    return nullptr;
  }
  return std::make_unique<FileLock>(std::move(*file));
}

}  // namespace accounts
