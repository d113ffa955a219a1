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

std::optional<FileDescriptor> asOpened(int number, std::string_view operation,
                                       std::string_view path, Failure& error) {
  if (number < 0) {
    error = pathFailure(operation, path, errno);
    return std::nullopt;
  }
  return FileDescriptor(number);
}

}  // namespace

DirectoryEntry::DirectoryEntry(std::shared_ptr<const FileDescriptor> directory, std::string name,
                               std::string path)
    : directory_(std::move(directory)), name_(std::move(name)), path_(std::move(path)) {}

std::optional<FileDescriptor> DirectoryEntry::openRegularFile(int flags, Failure& error) const {
  struct stat status = {};
  if (::fstatat(directory(), name(), &status, AT_SYMLINK_NOFOLLOW) != 0) {
    error = pathFailure("open", path_, errno);
    return std::nullopt;
  }
  // Looked at before it is opened as well: opening a device can already have an effect.
  if (!S_ISREG(status.st_mode)) {
    error = notRegularFailure("open", path_, status.st_mode);
    return std::nullopt;
  }
  const int safeFlags = flags | O_NOFOLLOW | O_NONBLOCK | O_CLOEXEC | O_NOCTTY;
  auto file = asOpened(::openat(directory(), name(), safeFlags), "open", path_, error);
  if (!file) {
    return std::nullopt;
  }
  const auto opened = fileStatus(*file, path_, error);
  if (!opened) {
    return std::nullopt;
  }
  if (!S_ISREG(opened->st_mode)) {
    error = notRegularFailure("open", path_, opened->st_mode);
    return std::nullopt;
  }
  return file;
}

std::optional<FileDescriptor> DirectoryEntry::openForItsPath(Failure& error) const {
  return asOpened(::openat(directory(), name(), O_PATH | O_NOFOLLOW | O_CLOEXEC), "open", path_,
                  error);
}

std::optional<FileDescriptor> DirectoryEntry::createFile(mode_t permissions, Failure& error) const {
  const int flags = O_RDWR | O_CREAT | O_EXCL | O_NOFOLLOW | O_CLOEXEC | O_NOCTTY;
  return asOpened(::openat(directory(), name(), flags, permissions), "create", path_, error);
}

bool DirectoryEntry::createDirectory(mode_t permissions, Failure& error) const {
  if (::mkdirat(directory(), name(), kOwnerOnly) != 0) {
    error = pathFailure("create the directory", path_, errno);
    return false;
  }
  // The process's mask applies to mkdir but not to fchmod.
  const int flags = O_RDONLY | O_DIRECTORY | O_NOFOLLOW | O_CLOEXEC;
  const auto made = asOpened(::openat(directory(), name(), flags), "open", path_, error);
  if (made && ::fchmod(made->number(), permissions) == 0) {
    return true;
  }
  if (made) {
    error = pathFailure("set the permissions of", path_, errno);
  }
  ::unlinkat(directory(), name(), AT_REMOVEDIR);
  return false;
}

int DirectoryEntry::remove() const {
  return ::unlinkat(directory(), name(), 0) == 0 ? 0 : errno;
}

std::optional<FileDescriptor> DirectoryEntry::openDirectory(Failure& error) const {
  const int flags = O_RDONLY | O_DIRECTORY | O_CLOEXEC;
  return asOpened(::openat(directory(), ".", flags), "open the directory of", path_, error);
}

}  // namespace accounts
