// System calls on names in open directories.

#include <fcntl.h>
#include <linux/openat2.h>
#include <sys/stat.h>
#include <sys/syscall.h>
#include <sys/types.h>
#include <unistd.h>

#include <cstdarg>
#include <cstdint>

#include "tests/campaign/SystemCalls.h"

using accounts::callOn;

namespace {

const char* textOf(std::uintptr_t argument) {
  return reinterpret_cast<const char*>(argument);
}

}  // namespace

// Names of this form are what the linker's option asks for.
// NOLINTBEGIN(bugprone-reserved-identifier,readability-identifier-naming)
extern "C" {

int __real_openat(int directory, const char* name, int flags, ...);
long __real_syscall(long number, ...);
int __real_fstatat(int directory, const char* name, struct stat* status, int flags);
int __real_faccessat(int directory, const char* name, int mode, int flags);
int __real_renameat(int directory, const char* name, int newDirectory, const char* newName);
int __real_renameat2(int directory, const char* name, int newDirectory, const char* newName,
                     unsigned flags);
int __real_unlinkat(int directory, const char* name, int flags);
int __real_linkat(int directory, const char* name, int newDirectory, const char* newName,
                  int flags);
int __real_mkdirat(int directory, const char* name, mode_t permissions);

int __wrap_openat(int directory, const char* name, int flags, ...) {
  va_list more;
  va_start(more, flags);
  const mode_t permissions = (flags & O_CREAT) != 0 ? va_arg(more, mode_t) : 0;
  va_end(more);
  return callOn(
      directory, [&](auto& kernel) { return kernel.openAt(directory, name, flags, permissions); },
      [&] { return __real_openat(directory, name, flags, permissions); });
}

int __wrap_fstatat(int directory, const char* name, struct stat* status, int flags) {
  return callOn(
      directory, [&](auto& kernel) { return kernel.statusAt(directory, name, *status, flags); },
      [&] { return __real_fstatat(directory, name, status, flags); });
}

int __wrap_faccessat(int directory, const char* name, int mode, int flags) {
  return callOn(
      directory, [&](auto& kernel) { return kernel.access(directory, name, mode, flags); },
      [&] { return __real_faccessat(directory, name, mode, flags); });
}

int __wrap_renameat(int directory, const char* name, int newDirectory, const char* newName) {
  return callOn(
      directory,
      [&](auto& kernel) { return kernel.rename(directory, name, newDirectory, newName, 0); },
      [&] { return __real_renameat(directory, name, newDirectory, newName); });
}

int __wrap_renameat2(int directory, const char* name, int newDirectory, const char* newName,
                     unsigned flags) {
  return callOn(
      directory,
      [&](auto& kernel) { return kernel.rename(directory, name, newDirectory, newName, flags); },
      [&] { return __real_renameat2(directory, name, newDirectory, newName, flags); });
}

int __wrap_unlinkat(int directory, const char* name, int flags) {
  return callOn(
      directory, [&](auto& kernel) { return kernel.unlink(directory, name, flags); },
      [&] { return __real_unlinkat(directory, name, flags); });
}

int __wrap_mkdirat(int directory, const char* name, mode_t permissions) {
  return callOn(
      directory, [&](auto& kernel) { return kernel.makeDirectory(directory, name, permissions); },
      [&] { return __real_mkdirat(directory, name, permissions); });
}

int __wrap_linkat(int directory, const char* name, int newDirectory, const char* newName,
                  int flags) {
  return callOn(
      directory,
      [&](auto& kernel) { return kernel.link(directory, name, newDirectory, newName, flags); },
      [&] { return __real_linkat(directory, name, newDirectory, newName, flags); });
}

// The calls that the C library may have no function for.
long __wrap_syscall(long number, ...) {
  va_list more;
  va_start(more, number);
  std::uintptr_t arguments[6] = {};
  for (std::uintptr_t& argument : arguments) {
    argument = va_arg(more, std::uintptr_t);
  }
  va_end(more);
  const int directory = static_cast<int>(arguments[0]);
  const auto real = [&] {
    return __real_syscall(number, arguments[0], arguments[1], arguments[2], arguments[3],
                          arguments[4], arguments[5]);
  };
  if (number == SYS_openat2) {
    const auto* how = reinterpret_cast<const open_how*>(arguments[2]);
    return callOn(
        directory,
        [&](auto& kernel) {
          return kernel.openBeneath(textOf(arguments[1]), static_cast<int>(how->flags));
        },
        real);
  }
  if (number == SYS_renameat2) {
    return callOn(
        directory,
        [&](auto& kernel) {
          return kernel.rename(directory, textOf(arguments[1]), static_cast<int>(arguments[2]),
                               textOf(arguments[3]), static_cast<unsigned>(arguments[4]));
        },
        real);
  }
  return real();
}

}  // extern "C"
// NOLINTEND(bugprone-reserved-identifier,readability-identifier-naming)
