#include "platform/linux/PathError.h"

#include <algorithm>
#include <cerrno>
#include <iterator>
#include <system_error>

namespace accounts {
namespace {

struct FileKind {
  mode_t bits;
  std::string_view name;
};

constexpr FileKind kOtherKinds[] = {
    {S_IFDIR, "a directory"}, {S_IFLNK, "a symbolic link"},    {S_IFIFO, "a named pipe"},
    {S_IFSOCK, "a socket"},   {S_IFCHR, "a character device"}, {S_IFBLK, "a block device"},
};

// Room, media, and what the system has too little of at times.
constexpr int kPassingNumbers[] = {EAGAIN, EDQUOT, EIO,    EMFILE,   ENFILE,
                                   ENOMEM, ENOSPC, ESTALE, ETIMEDOUT};

std::string_view nameOfKind(mode_t mode) {
  for (const FileKind& kind : kOtherKinds) {
    if ((mode & S_IFMT) == kind.bits) {
      return kind.name;
    }
  }
  return "of an unknown kind";
}

std::string text(std::string_view operation, std::string_view path, std::string_view reason) {
  std::string result = "Cannot ";
  result.append(operation).append(" ").append(path).append(": ").append(reason);
  return result;
}

}  // namespace

FailureKind failureKind(int number) {
  return std::find(std::begin(kPassingNumbers), std::end(kPassingNumbers), number) !=
                 std::end(kPassingNumbers)
             ? FailureKind::MayPass
             : FailureKind::Lasting;
}

bool PathError::isMissing() const {
  return number == ENOENT || number == ENOTDIR;
}

PathError pathError(std::string_view operation, std::string_view path, int number) {
  return {number, text(operation, path, std::generic_category().message(number))};
}

PathError pathError(std::string_view operation, std::string_view path, std::string_view reason) {
  return {0, text(operation, path, reason)};
}

PathError notRegularError(std::string_view operation, std::string_view path, mode_t mode) {
  std::string reason = "It is ";
  reason.append(nameOfKind(mode)).append(", not a regular file");
  return pathError(operation, path, reason);
}

}  // namespace accounts
