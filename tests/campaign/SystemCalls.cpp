// The system calls of the Linux platform, as the linker gives them to this program instead of the C
// library's (--wrap): those on the simulated device go to the simulated kernel, all others to the
// real one. So what the campaign tries is the platform itself, not a model of it.

#include <dirent.h>
#include <fcntl.h>
#include <linux/openat2.h>
#include <sys/file.h>
#include <sys/stat.h>
#include <sys/syscall.h>
#include <sys/types.h>
#include <unistd.h>

#include <cerrno>
#include <cstdarg>
#include <string>
#include <vector>

#include "tests/campaign/AllocationFailures.h"
#include "tests/campaign/SimulatedKernel.h"

namespace accounts {

namespace {

/// The kernel when a descriptor is a simulated one, else null.
SimulatedKernel* kernelOf(int descriptor) {
  return descriptor >= SimulatedKernel::kFirstDescriptor ? SimulatedKernel::current() : nullptr;
}

/// Gives a simulated call's result the way that system calls do.
template <class Number>
Number given(Number result) {
  if (result < 0) {
    errno = static_cast<int>(-result);
    return -1;
  }
  return result;
}

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
int __real_openat(int directory, const char* name, int flags, ...);
long __real_syscall(long number, ...);
int __real_fstat(int descriptor, struct stat* status);
int __real_fstatat(int directory, const char* name, struct stat* status, int flags);
ssize_t __real_read(int descriptor, void* bytes, size_t count);
ssize_t __real_write(int descriptor, const void* bytes, size_t count);
int __real_fsync(int descriptor);
int __real_ftruncate(int descriptor, off_t size);
int __real_fchmod(int descriptor, mode_t permissions);
int __real_fchown(int descriptor, uid_t owner, gid_t group);
int __real_renameat(int directory, const char* name, int newDirectory, const char* newName);
int __real_unlinkat(int directory, const char* name, int flags);
int __real_linkat(int directory, const char* name, int newDirectory, const char* newName,
                  int flags);
int __real_futimens(int descriptor, const timespec* times);
DIR* __real_fdopendir(int descriptor);
dirent* __real_readdir(DIR* directory);
int __real_closedir(DIR* directory);
int __real_mkdirat(int directory, const char* name, mode_t permissions);
int __real_flock(int descriptor, int operation);
int __real_close(int descriptor);
ssize_t __real_getrandom(void* bytes, size_t count, unsigned flags);

int __wrap_open(const char* path, int flags, ...) {
  va_list more;
  va_start(more, flags);
  const mode_t permissions = (flags & O_CREAT) != 0 ? va_arg(more, mode_t) : 0;
  va_end(more);
  const AllocationsSucceed whileInTheKernel;
  SimulatedKernel* kernel = SimulatedKernel::current();
  return kernel != nullptr && path == SimulatedKernel::kDeviceDirectory
             ? given(kernel->open(path))
             : __real_open(path, flags, permissions);
}

int __wrap_openat(int directory, const char* name, int flags, ...) {
  va_list more;
  va_start(more, flags);
  const mode_t permissions = (flags & O_CREAT) != 0 ? va_arg(more, mode_t) : 0;
  va_end(more);
  const AllocationsSucceed whileInTheKernel;
  SimulatedKernel* kernel = kernelOf(directory);
  return kernel != nullptr ? given(kernel->openAt(directory, name, flags, permissions))
                           : __real_openat(directory, name, flags, permissions);
}

// The platform's only direct call is openat2.
long __wrap_syscall(long number, ...) {
  va_list arguments;
  va_start(arguments, number);
  const int directory = va_arg(arguments, int);
  const char* path = va_arg(arguments, const char*);
  open_how* how = va_arg(arguments, open_how*);
  const size_t size = va_arg(arguments, size_t);
  va_end(arguments);
  if (number != SYS_openat2) {
    errno = ENOSYS;
    return -1;
  }
  const AllocationsSucceed whileInTheKernel;
  SimulatedKernel* kernel = kernelOf(directory);
  return kernel != nullptr
             ? given(kernel->openBeneath(directory, path, static_cast<int>(how->flags)))
             : __real_syscall(number, directory, path, how, size);
}

int __wrap_fstat(int descriptor, struct stat* status) {
  const AllocationsSucceed whileInTheKernel;
  SimulatedKernel* kernel = kernelOf(descriptor);
  return kernel != nullptr ? given(kernel->status(descriptor, *status))
                           : __real_fstat(descriptor, status);
}

int __wrap_fstatat(int directory, const char* name, struct stat* status, int flags) {
  const AllocationsSucceed whileInTheKernel;
  SimulatedKernel* kernel = kernelOf(directory);
  return kernel != nullptr ? given(kernel->statusAt(directory, name, *status))
                           : __real_fstatat(directory, name, status, flags);
}

ssize_t __wrap_read(int descriptor, void* bytes, size_t count) {
  const AllocationsSucceed whileInTheKernel;
  SimulatedKernel* kernel = kernelOf(descriptor);
  return kernel != nullptr ? given(kernel->read(descriptor, static_cast<char*>(bytes), count))
                           : __real_read(descriptor, bytes, count);
}

ssize_t __wrap_write(int descriptor, const void* bytes, size_t count) {
  const AllocationsSucceed whileInTheKernel;
  SimulatedKernel* kernel = kernelOf(descriptor);
  return kernel != nullptr
             ? given(kernel->write(descriptor, {static_cast<const char*>(bytes), count}))
             : __real_write(descriptor, bytes, count);
}

int __wrap_fsync(int descriptor) {
  const AllocationsSucceed whileInTheKernel;
  SimulatedKernel* kernel = kernelOf(descriptor);
  return kernel != nullptr ? given(kernel->synchronize(descriptor)) : __real_fsync(descriptor);
}

int __wrap_ftruncate(int descriptor, off_t size) {
  const AllocationsSucceed whileInTheKernel;
  SimulatedKernel* kernel = kernelOf(descriptor);
  return kernel != nullptr ? given(kernel->truncate(descriptor, static_cast<size_t>(size)))
                           : __real_ftruncate(descriptor, size);
}

int __wrap_fchmod(int descriptor, mode_t permissions) {
  const AllocationsSucceed whileInTheKernel;
  SimulatedKernel* kernel = kernelOf(descriptor);
  return kernel != nullptr ? given(kernel->setPermissions(descriptor, permissions))
                           : __real_fchmod(descriptor, permissions);
}

int __wrap_fchown(int descriptor, uid_t owner, gid_t group) {
  const AllocationsSucceed whileInTheKernel;
  SimulatedKernel* kernel = kernelOf(descriptor);
  return kernel != nullptr ? given(kernel->setOwner(descriptor, owner, group))
                           : __real_fchown(descriptor, owner, group);
}

int __wrap_renameat(int directory, const char* name, int newDirectory, const char* newName) {
  const AllocationsSucceed whileInTheKernel;
  SimulatedKernel* kernel = kernelOf(directory);
  return kernel != nullptr ? given(kernel->rename(directory, name, newDirectory, newName))
                           : __real_renameat(directory, name, newDirectory, newName);
}

int __wrap_unlinkat(int directory, const char* name, int flags) {
  const AllocationsSucceed whileInTheKernel;
  SimulatedKernel* kernel = kernelOf(directory);
  return kernel != nullptr ? given(kernel->unlink(directory, name, flags))
                           : __real_unlinkat(directory, name, flags);
}

int __wrap_mkdirat(int directory, const char* name, mode_t permissions) {
  const AllocationsSucceed whileInTheKernel;
  SimulatedKernel* kernel = kernelOf(directory);
  return kernel != nullptr ? given(kernel->makeDirectory(directory, name, permissions))
                           : __real_mkdirat(directory, name, permissions);
}

int __wrap_linkat(int directory, const char* name, int newDirectory, const char* newName,
                  int flags) {
  const AllocationsSucceed whileInTheKernel;
  SimulatedKernel* kernel = kernelOf(directory);
  return kernel != nullptr ? given(kernel->link(directory, name, newDirectory, newName))
                           : __real_linkat(directory, name, newDirectory, newName, flags);
}

int __wrap_futimens(int descriptor, const timespec* times) {
  const AllocationsSucceed whileInTheKernel;
  SimulatedKernel* kernel = kernelOf(descriptor);
  return kernel != nullptr ? given(kernel->setTimes(descriptor))
                           : __real_futimens(descriptor, times);
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
  SimulatedKernel* kernel = kernelOf(descriptor);
  return kernel != nullptr ? given(kernel->lock(descriptor, operation))
                           : __real_flock(descriptor, operation);
}

int __wrap_close(int descriptor) {
  SimulatedKernel* kernel = kernelOf(descriptor);
  if (kernel == nullptr) {
    return __real_close(descriptor);
  }
  kernel->close(descriptor);
  return 0;
}

ssize_t __wrap_getrandom(void* bytes, size_t count, unsigned flags) {
  SimulatedKernel* kernel = SimulatedKernel::current();
  if (kernel == nullptr) {
    return __real_getrandom(bytes, count, flags);
  }
  kernel->random(static_cast<char*>(bytes), count);
  return static_cast<ssize_t>(count);
}

}  // extern "C"
// NOLINTEND(bugprone-reserved-identifier,readability-identifier-naming)
