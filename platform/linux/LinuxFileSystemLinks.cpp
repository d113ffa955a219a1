#include <fcntl.h>
#include <sys/stat.h>
#include <unistd.h>

#include <algorithm>
#include <array>
#include <cerrno>

#include "platform/linux/FileContents.h"
#include "platform/linux/LinuxFileSystem.h"
#include "platform/linux/PathResult.h"

namespace accounts {
namespace {

// What the kernel answers where a file can have no further name: two file systems, one without
// links, a file with too many, a file that is another user's.
constexpr std::array kNoLinkHere = {EXDEV, EPERM, EMLINK, EOPNOTSUPP};

// The status of a regular file, whether it can be read or not.
std::optional<struct stat> regularFileStatus(const DirectoryEntry& entry,
                                             std::string_view operation, PathError& error) {
  struct stat status = {};
  if (::fstatat(entry.directory(), entry.name(), &status, AT_SYMLINK_NOFOLLOW) != 0) {
    error = pathError(operation, entry.path(), errno);
    return std::nullopt;
  }
  if (!S_ISREG(status.st_mode)) {
    error = notRegularError(operation, entry.path(), status.st_mode);
    return std::nullopt;
  }
  return status;
}

// Gives a copy what its source has besides contents. A user without privileges can give no file
// away; the copy then stays that user's.
int copyAttributes(const FileDescriptor& copy, const struct stat& status) {
  const timespec times[] = {status.st_atim, status.st_mtim};
  const bool isOwned = ::fchown(copy.number(), status.st_uid, status.st_gid) == 0 || errno == EPERM;
  return isOwned && ::fchmod(copy.number(), status.st_mode & kPermissionBits) == 0 &&
                 ::futimens(copy.number(), times) == 0
             ? 0
             : errno;
}

Result copyWithAttributes(const DirectoryEntry& source, const DirectoryEntry& destination) {
  PathError error;
  const auto original = source.openRegularFile(O_RDONLY, error);
  const auto status = original ? fileStatus(*original, source.path(), error) : std::nullopt;
  const auto copy = status ? destination.createFile(kOwnerOnlyFile, error) : std::nullopt;
  if (!copy) {
    return asResult(error);
  }
  if (!copyContents(*original, source.path(), *copy, destination.path(), error)) {
    (void)destination.remove();
    return asResult(error);
  }
  int number = copyAttributes(*copy, *status);
  if (number == 0) {
    number = flush(*copy);
  }
  if (number != 0) {
    (void)destination.remove();
  }
  return asResult("copy to", destination.path(), number);
}

}  // namespace

Result LinuxFileSystem::linkFile(std::string_view source, std::string_view destination) {
  PathError error;
  const auto from = root_.locate(source, error);
  const auto to = from ? root_.locate(destination, error) : std::nullopt;
  if (!to || !regularFileStatus(*from, "link", error)) {
    return asResult(error);
  }
  if (::linkat(from->directory(), from->name(), to->directory(), to->name(), 0) != 0) {
    const int number = errno;
    return std::ranges::find(kNoLinkHere, number) != kNoLinkHere.end()
               ? copyWithAttributes(*from, *to)
               : asResult("link " + from->path() + " to", destination, number);
  }
  // A file that may not be read cannot be flushed either; whoever wrote it had to.
  const auto file = to->openRegularFile(O_RDONLY, error);
  const int number = file ? flush(*file) : 0;
  if (number != 0) {
    (void)to->remove();
  }
  return asResult("flush", source, number);
}

bool LinuxFileSystem::haveSameContents(std::string_view first, std::string_view second) {
  PathError error;
  const auto one = root_.locate(first, error);
  const auto other = one ? root_.locate(second, error) : std::nullopt;
  const auto oneStatus = other ? regularFileStatus(*one, "compare", error) : std::nullopt;
  const auto otherStatus = oneStatus ? regularFileStatus(*other, "compare", error) : std::nullopt;
  if (!otherStatus || oneStatus->st_size != otherStatus->st_size) {
    return false;
  }
  if (oneStatus->st_dev == otherStatus->st_dev && oneStatus->st_ino == otherStatus->st_ino) {
    return true;
  }
  const auto oneFile = one->openRegularFile(O_RDONLY, error);
  const auto otherFile = oneFile ? other->openRegularFile(O_RDONLY, error) : std::nullopt;
  const auto contents = otherFile ? readContents(*oneFile, first, error) : std::nullopt;
  return contents && contents == readContents(*otherFile, second, error);
}

}  // namespace accounts
