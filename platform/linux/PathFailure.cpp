#include "platform/linux/PathFailure.h"

#include <string>
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

Failure pathFailure(std::string_view operation, std::string_view path, int number) {
  return {number, text(operation, path, std::generic_category().message(number))};
}

Failure pathFailure(std::string_view operation, std::string_view path, std::string_view reason) {
  return {0, text(operation, path, reason)};
}

Failure notRegularFailure(std::string_view operation, std::string_view path, mode_t mode) {
  std::string reason = "It is ";
  reason.append(nameOfKind(mode)).append(", not a regular file");
  return pathFailure(operation, path, reason);
}

}  // namespace accounts
