#include "platform/linux/DeviceRoot.h"

#include <fcntl.h>
#include <linux/openat2.h>
#include <sys/stat.h>
#include <sys/syscall.h>
#include <unistd.h>

#include <cerrno>
#include <cstdint>
#include <utility>

#include "platform/linux/FileContents.h"
#include "vocabulary/DevicePath.h"

namespace accounts {
namespace {

// The kernel gives EAGAIN when something was renamed while it resolved a "..", which passes.
constexpr int kMostRestarts = 1000;

int openBeneath(int directory, const std::string& path, int flags) {
  open_how how = {};
  how.flags = static_cast<std::uint64_t>(flags | O_CLOEXEC);
  how.resolve = RESOLVE_IN_ROOT | RESOLVE_NO_MAGICLINKS;
  long number = -1;
  for (int attempt = 0; attempt < kMostRestarts; ++attempt) {
    number = ::syscall(SYS_openat2, directory, path.c_str(), &how, sizeof how);
    if (number >= 0 || (errno != EAGAIN && errno != EINTR)) {
      break;
    }
  }
  return static_cast<int>(number);
}

bool isRootOfTheSystem(const FileDescriptor& directory) {
  struct stat opened = {};
  struct stat system = {};
  return ::fstat(directory.number(), &opened) == 0 && ::stat("/", &system) == 0 &&
         opened.st_dev == system.st_dev && opened.st_ino == system.st_ino;
}

}  // namespace

OrFailure<DeviceRoot> DeviceRoot::openRoot(const std::string& hostDirectory) {
  const int number = ::open(hostDirectory.c_str(), O_PATH | O_DIRECTORY | O_CLOEXEC);
  if (number < 0) {
    return pathFailure("open the device root", hostDirectory, errno);
  }
  FileDescriptor directory(number);
  const int probe = openBeneath(directory.number(), "/", O_PATH | O_DIRECTORY);
  if (probe < 0) {
    Failure error = pathFailure("resolve paths beneath the device root", hostDirectory, errno);
    error.text += " (openat2, of Linux 5.6 or later, is needed)";
    return error;
  }
  ::close(probe);
  const bool isSystemRoot = isRootOfTheSystem(directory);
  return DeviceRoot(std::move(directory), isSystemRoot);
}

OrFailure<FileDescriptor> DeviceRoot::open(std::string_view path, int flags) const {
  if (path.find('\0') != std::string_view::npos) {
    return pathFailure("open", path, EINVAL);
  }
  const int number = openBeneath(directory_.number(), std::string(path), flags);
  if (number < 0) {
    return pathFailure("open", path, errno);
  }
  return FileDescriptor(number);
}

OrFailure<FileDescriptor> DeviceRoot::openIfRegular(std::string_view path, int flags) const {
  auto file = open(path, flags);
  const auto status = file ? fileStatus(*file, path) : file.error();
  if (!status) {
    return status.error();
  }
  if (!S_ISREG(status->st_mode)) {
    return notRegularFailure("open", path, status->st_mode);
  }
  return file;
}

OrFailure<FileDescriptor> DeviceRoot::openRegularFile(std::string_view path) const {
  // First for its path alone: opening a device can already have an effect.
  auto file = openIfRegular(path, O_PATH);
  return file ? openIfRegular(path, O_RDONLY | O_NONBLOCK | O_NOCTTY) : std::move(file);
}

OrFailure<std::string> DeviceRoot::readFile(std::string_view path) const {
  const auto file = openRegularFile(path);
  return file ? readContents(*file, path) : file.error();
}

OrFailure<DirectoryEntry> DeviceRoot::locate(std::string_view path) const {
  const SplitPath split = splitPath(path);
  if (split.name.empty() || split.name == "." || split.name == ".." ||
      split.name.find('\0') != std::string_view::npos) {
    return pathFailure("find a name in", path, EINVAL);
  }
  auto directory = open(split.directory, O_PATH | O_DIRECTORY);
  if (!directory) {
    return directory.error();
  }
  return DirectoryEntry(std::move(*directory), std::string(split.name), std::string(path));
}

}  // namespace accounts
