#include "platform/linux/RenameToNothing.h"

#include <fcntl.h>
#include <unistd.h>

#include <cerrno>
#include <cstdio>

namespace accounts {

bool cannotExchange(int number) {
  return number == EINVAL || number == ENOSYS || number == EOPNOTSUPP;
}

int renameToNothing(int directory, const char* from, const char* to) {
  if (::renameat2(directory, from, directory, to, RENAME_NOREPLACE) == 0) {
    return 0;
  }
  if (!cannotExchange(errno)) {
    return errno;
  }
  if (::linkat(directory, from, directory, to, 0) != 0) {
    return errno;
  }
  return ::unlinkat(directory, from, 0) == 0 ? 0 : errno;
}

}  // namespace accounts
