#include "platform/linux/LinkedOrCopied.h"

#include <fcntl.h>
#include <sys/stat.h>
#include <unistd.h>

#include <cerrno>

#include "platform/linux/FileContents.h"

namespace accounts {
namespace {

int copyAttributes(const FileDescriptor& copy, const struct stat& status) {
  const timespec times[] = {status.st_atim, status.st_mtim};
  const bool isOwned = ::fchown(copy.number(), status.st_uid, status.st_gid) == 0 || errno == EPERM;
  return isOwned && ::fchmod(copy.number(), status.st_mode & kPermissionBits) == 0 &&
                 ::futimens(copy.number(), times) == 0
             ? 0
             : errno;
}

bool copyWithAttributes(const DirectoryEntry& source, const DirectoryEntry& destination,
                        Failure& error) {
  const auto original = source.openRegularFile(O_RDONLY, error);
  const auto status = original ? fileStatus(*original, source.path(), error) : std::nullopt;
  const auto copy = status ? destination.createFile(kOwnerOnlyFile, error) : std::nullopt;
  if (!copy) {
    return false;
  }
  if (copyContents(*original, source.path(), *copy, destination.path(), error)) {
    int number = copyAttributes(*copy, *status);
    if (number == 0) {
      number = flush(*copy);
    }
    if (number == 0) {
      return true;
    }
    error = pathFailure("copy to", destination.path(), number);
  }
  (void)destination.remove();
  return false;
}

}  // namespace

bool linkOrCopy(const DirectoryEntry& source, const DirectoryEntry& destination, Failure& error) {
  if (::linkat(source.directory(), source.name(), destination.directory(), destination.name(), 0) !=
      0) {
    return copyWithAttributes(source, destination, error);
  }
  struct stat status = {};
  const bool isRegular =
      ::fstatat(destination.directory(), destination.name(), &status, AT_SYMLINK_NOFOLLOW) == 0 &&
      S_ISREG(status.st_mode);
  const auto file = isRegular ? destination.openRegularFile(O_RDONLY, error) : std::nullopt;
  const int number = file ? flush(*file) : 0;
  if (number != 0) {
    error = pathFailure("flush", source.path(), number);
    (void)destination.remove();
  }
  return number == 0;
}

}  // namespace accounts
