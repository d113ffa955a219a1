// System calls on what is open, and those that open.

#include "tests/campaign/SystemCalls.h"

#include <dirent.h>
#include <fcntl.h>
#include <linux/fs.h>
#include <sys/file.h>
#include <sys/ioctl.h>
#include <sys/stat.h>
#include <sys/types.h>
#include <unistd.h>

#include <cstdarg>
#include <string>
#include <vector>

namespace accounts {

namespace {

/// An open directory of the simulated device, in place of the C library's.
struct SimulatedDirectory {
  int descriptor = 0;
  std::vector<std::string> names = {};
  std::size_t next = 0;
  dirent entry = {};
};

/// Those that are open: a DIR* is one of these if it is among them.
std::vector<SimulatedDirectory*> openDirectories;

SimulatedDirectory* simulated(DIR* directory) {
  for (SimulatedDirectory* each : openDirectories) {
    if (static_cast<void*>(each) == static_cast<void*>(directory)) {
      return each;
    }
  }
  return nullptr;
}

}  // namespace

}  // namespace accounts

using accounts::AllocationsSucceed;
using accounts::callOn;
using accounts::given;
using accounts::kernelOf;
using accounts::openDirectories;
using accounts::simulated;
using accounts::SimulatedDirectory;
using accounts::SimulatedKernel;

// Names of this form are what the linker's option asks for.
// NOLINTBEGIN(bugprone-reserved-identifier,readability-identifier-naming)
extern "C" {

int __real_open(const char* path, int flags, ...);
int __real_fstat(int descriptor, struct stat* status);
ssize_t __real_read(int descriptor, void* bytes, size_t count);
ssize_t __real_pread(int descriptor, void* bytes, size_t count, off_t offset);
ssize_t __real_write(int descriptor, const void* bytes, size_t count);
ssize_t __real_pwrite(int descriptor, const void* bytes, size_t count, off_t offset);
int __real_fsync(int descriptor);
int __real_fdatasync(int descriptor);
int __real_ftruncate(int descriptor, off_t size);
int __real_fchmod(int descriptor, mode_t permissions);
int __real_fchown(int descriptor, uid_t owner, gid_t group);
int __real_futimens(int descriptor, const timespec* times);
int __real_ioctl(int descriptor, unsigned long request, ...);
DIR* __real_fdopendir(int descriptor);
dirent* __real_readdir(DIR* directory);
int __real_closedir(DIR* directory);
int __real_flock(int descriptor, int operation);
int __real_close(int descriptor);
ssize_t __real_getrandom(void* bytes, size_t count, unsigned flags);
uid_t __real_geteuid();

int __wrap_open(const char* path, int flags, ...) {
  va_list more;
  va_start(more, flags);
  const mode_t permissions = (flags & O_CREAT) != 0 ? va_arg(more, mode_t) : 0;
  va_end(more);
  const AllocationsSucceed whileInTheKernel;
  SimulatedKernel* kernel = SimulatedKernel::current();
  return kernel != nullptr && path == SimulatedKernel::kDeviceDirectory
             ? given(kernel->open(path, flags))
             : __real_open(path, flags, permissions);
}

int __wrap_fstat(int descriptor, struct stat* status) {
  return callOn(
      descriptor, [&](auto& kernel) { return kernel.status(descriptor, *status); },
      [&] { return __real_fstat(descriptor, status); });
}

ssize_t __wrap_read(int descriptor, void* bytes, size_t count) {
  return callOn(
      descriptor,
      [&](auto& kernel) { return kernel.read(descriptor, static_cast<char*>(bytes), count); },
      [&] { return __real_read(descriptor, bytes, count); });
}

ssize_t __wrap_pread(int descriptor, void* bytes, size_t count, off_t offset) {
  return callOn(
      descriptor,
      [&](auto& kernel) {
        return kernel.readAt(descriptor, static_cast<char*>(bytes), count,
                             static_cast<size_t>(offset));
      },
      [&] { return __real_pread(descriptor, bytes, count, offset); });
}

ssize_t __wrap_write(int descriptor, const void* bytes, size_t count) {
  return callOn(
      descriptor,
      [&](auto& kernel) {
        return kernel.write(descriptor, {static_cast<const char*>(bytes), count});
      },
      [&] { return __real_write(descriptor, bytes, count); });
}

ssize_t __wrap_pwrite(int descriptor, const void* bytes, size_t count, off_t offset) {
  return callOn(
      descriptor,
      [&](auto& kernel) {
        return kernel.writeAt(descriptor, {static_cast<const char*>(bytes), count},
                              static_cast<size_t>(offset));
      },
      [&] { return __real_pwrite(descriptor, bytes, count, offset); });
}

int __wrap_fsync(int descriptor) {
  return callOn(
      descriptor, [&](auto& kernel) { return kernel.synchronize("fsync", descriptor); },
      [&] { return __real_fsync(descriptor); });
}

int __wrap_fdatasync(int descriptor) {
  return callOn(
      descriptor, [&](auto& kernel) { return kernel.synchronize("fdatasync", descriptor); },
      [&] { return __real_fdatasync(descriptor); });
}

int __wrap_ftruncate(int descriptor, off_t size) {
  return callOn(
      descriptor,
      [&](auto& kernel) { return kernel.truncate(descriptor, static_cast<size_t>(size)); },
      [&] { return __real_ftruncate(descriptor, size); });
}

int __wrap_fchmod(int descriptor, mode_t permissions) {
  return callOn(
      descriptor, [&](auto& kernel) { return kernel.setPermissions(descriptor, permissions); },
      [&] { return __real_fchmod(descriptor, permissions); });
}

int __wrap_fchown(int descriptor, uid_t owner, gid_t group) {
  return callOn(
      descriptor, [&](auto& kernel) { return kernel.setOwner(descriptor, owner, group); },
      [&] { return __real_fchown(descriptor, owner, group); });
}

int __wrap_futimens(int descriptor, const timespec* times) {
  return callOn(
      descriptor, [&](auto& kernel) { return kernel.setTimes(descriptor, times); },
      [&] { return __real_futimens(descriptor, times); });
}

int __wrap_ioctl(int descriptor, unsigned long request, ...) {
  va_list more;
  va_start(more, request);
  void* argument = va_arg(more, void*);
  va_end(more);
  return callOn(
      descriptor,
      [&](auto& kernel) {
        return request == FS_IOC_GETFLAGS ? kernel.flags(descriptor, *static_cast<int*>(argument))
                                          : -ENOTTY;
      },
      [&] { return __real_ioctl(descriptor, request, argument); });
}

DIR* __wrap_fdopendir(int descriptor) {
  const AllocationsSucceed whileInTheKernel;
  SimulatedKernel* kernel = kernelOf(descriptor);
  if (kernel == nullptr) {
    return __real_fdopendir(descriptor);
  }
  auto* directory = new SimulatedDirectory{.descriptor = descriptor};
  if (given(kernel->readNames(descriptor, directory->names)) != 0) {
    delete directory;
    return nullptr;
  }
  openDirectories.push_back(directory);
  return reinterpret_cast<DIR*>(directory);
}

dirent* __wrap_readdir(DIR* stream) {
  SimulatedDirectory* directory = simulated(stream);
  if (directory == nullptr) {
    return __real_readdir(stream);
  }
  if (directory->next == directory->names.size()) {
    return nullptr;
  }
  const std::string& name = directory->names[directory->next++];
  directory->entry.d_name[name.copy(directory->entry.d_name, sizeof directory->entry.d_name - 1)] =
      '\0';
  return &directory->entry;
}

int __wrap_closedir(DIR* stream) {
  const AllocationsSucceed whileInTheKernel;
  SimulatedDirectory* directory = simulated(stream);
  if (directory == nullptr) {
    return __real_closedir(stream);
  }
  kernelOf(directory->descriptor)->close(directory->descriptor);
  std::erase(openDirectories, directory);
  delete directory;
  return 0;
}

int __wrap_flock(int descriptor, int operation) {
  return callOn(
      descriptor, [&](auto& kernel) { return kernel.lock(descriptor, operation); },
      [&] { return __real_flock(descriptor, operation); });
}

int __wrap_close(int descriptor) {
  return callOn(
      descriptor, [&](auto& kernel) { return kernel.close(descriptor); },
      [&] { return __real_close(descriptor); });
}

ssize_t __wrap_getrandom(void* bytes, size_t count, unsigned flags) {
  SimulatedKernel* kernel = SimulatedKernel::current();
  if (kernel == nullptr) {
    return __real_getrandom(bytes, count, flags);
  }
  kernel->random(static_cast<char*>(bytes), count);
  return static_cast<ssize_t>(count);
}

// The kernel lets the process do everything, whoever runs the campaign.
uid_t __wrap_geteuid() {
  constexpr uid_t kRoot = 0;
  return SimulatedKernel::current() != nullptr ? kRoot : __real_geteuid();
}

}  // extern "C"
// NOLINTEND(bugprone-reserved-identifier,readability-identifier-naming)
