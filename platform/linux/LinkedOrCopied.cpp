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

Result copyWithAttributes(const DirectoryEntry& source, const DirectoryEntry& destination) {
  const auto original = source.openRegularFile(O_RDONLY);
  const auto status = original ? fileStatus(*original, source.path()) : original.error();
  const auto copy = status ? destination.createFile(kOwnerOnlyFile) : status.error();
  if (!copy) {
    return copy.error();
  }
  Result copied = copyContents(*original, source.path(), *copy, destination.path());
  if (copied) {
    const int number = copyAttributes(*copy, *status);
    copied = asResult("copy to", destination.path(), number == 0 ? flush(*copy) : number);
  }
  if (!copied) {
    (void)destination.remove();
  }
  return copied;
}

}  // namespace

Result linkOrCopy(const DirectoryEntry& source, const DirectoryEntry& destination) {
  if (::linkat(source.directory(), source.name(), destination.directory(), destination.name(), 0) !=
      0) {
    return copyWithAttributes(source, destination);
  }
  struct stat status = {};
  const bool isRegular =
      ::fstatat(destination.directory(), destination.name(), &status, AT_SYMLINK_NOFOLLOW) == 0 &&
      S_ISREG(status.st_mode);
  if (!isRegular) {
    return {};
  }
  const auto file = destination.openRegularFile(O_RDONLY);
  const int number = file ? flush(*file) : 0;
  if (number != 0) {
    (void)destination.remove();
  }
  return asResult("flush", source.path(), number);
}

}  // namespace accounts
