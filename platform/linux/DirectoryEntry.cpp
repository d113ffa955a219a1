#include "platform/linux/DirectoryEntry.h"

#include <fcntl.h>
#include <sys/stat.h>
#include <unistd.h>

#include <cerrno>
#include <utility>

#include "platform/linux/FileContents.h"

namespace accounts {
namespace {

constexpr mode_t kOwnerOnly = 0700;

OrFailure<FileDescriptor> asOpened(int number, std::string_view operation, std::string_view path) {
  if (number < 0) {
    return pathFailure(operation, path, errno);
  }
  return FileDescriptor(number);
}

}  // namespace

DirectoryEntry::DirectoryEntry(std::shared_ptr<const FileDescriptor> directory, std::string name,
                               std::string path)
    : directory_(std::move(directory)), name_(std::move(name)), path_(std::move(path)) {}

OrFailure<FileDescriptor> DirectoryEntry::openRegularFile(int flags) const {
  struct stat status = {};
  if (::fstatat(directory(), name(), &status, AT_SYMLINK_NOFOLLOW) != 0) {
    return pathFailure("open", path_, errno);
  }
  // Looked at before it is opened as well: opening a device can already have an effect.
  if (!S_ISREG(status.st_mode)) {
    return notRegularFailure("open", path_, status.st_mode);
  }
  const int safeFlags = flags | O_NOFOLLOW | O_NONBLOCK | O_CLOEXEC | O_NOCTTY;
  auto file = asOpened(::openat(directory(), name(), safeFlags), "open", path_);
  const auto opened = file ? fileStatus(*file, path_) : file.error();
  if (!opened) {
    return opened.error();
  }
  if (!S_ISREG(opened->st_mode)) {
    return notRegularFailure("open", path_, opened->st_mode);
  }
  return file;
}

OrFailure<FileDescriptor> DirectoryEntry::openForItsPath() const {
  return asOpened(::openat(directory(), name(), O_PATH | O_NOFOLLOW | O_CLOEXEC), "open", path_);
}

OrFailure<FileDescriptor> DirectoryEntry::createFile(mode_t permissions) const {
  const int flags = O_RDWR | O_CREAT | O_EXCL | O_NOFOLLOW | O_CLOEXEC | O_NOCTTY;
  return asOpened(::openat(directory(), name(), flags, permissions), "create", path_);
}

Result DirectoryEntry::createDirectory(mode_t permissions) const {
  if (::mkdirat(directory(), name(), kOwnerOnly) != 0) {
    return pathFailure("create the directory", path_, errno);
  }
  // The process's mask applies to mkdir but not to fchmod.
  const int flags = O_RDONLY | O_DIRECTORY | O_NOFOLLOW | O_CLOEXEC;
  const auto made = asOpened(::openat(directory(), name(), flags), "open", path_);
  if (made && ::fchmod(made->number(), permissions) == 0) {
    return {};
  }
  Failure error = made ? pathFailure("set the permissions of", path_, errno) : made.error();
  ::unlinkat(directory(), name(), AT_REMOVEDIR);
  return error;
}

int DirectoryEntry::remove() const {
  return ::unlinkat(directory(), name(), 0) == 0 ? 0 : errno;
}

OrFailure<FileDescriptor> DirectoryEntry::openDirectory() const {
  const int flags = O_RDONLY | O_DIRECTORY | O_CLOEXEC;
  return asOpened(::openat(directory(), ".", flags), "open the directory of", path_);
}

}  // namespace accounts
