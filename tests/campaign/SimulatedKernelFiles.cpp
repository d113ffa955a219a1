// What the simulated kernel does with what is open.

#include <fcntl.h>
#include <linux/fs.h>

#include <algorithm>
#include <cerrno>
#include <utility>

#include "tests/campaign/SimulatedKernel.h"

namespace accounts {

namespace {

constexpr std::uint64_t kNanoseconds = 1'000'000'000;

using Kind = DiskChange::Kind;

timespec timeOf(std::uint64_t nanoseconds) {
  return {.tv_sec = static_cast<time_t>(nanoseconds / kNanoseconds),
          .tv_nsec = static_cast<long>(nanoseconds % kNanoseconds)};
}

std::uint64_t nanosecondsOf(const timespec& time) {
  return static_cast<std::uint64_t>(time.tv_sec) * kNanoseconds +
         static_cast<std::uint64_t>(time.tv_nsec);
}

}  // namespace

struct stat SimulatedKernel::statusOf(std::size_t number) const {
  const SimulatedInode& inode = disk_.inode(number);
  struct stat status = {};
  status.st_dev = disk_.device();
  status.st_ino = inode.number;
  status.st_mode = (inode.isDirectory ? S_IFDIR : S_IFREG) | inode.permissions;
  status.st_nlink = inode.links;
  status.st_uid = inode.owner;
  status.st_gid = inode.group;
  status.st_size = static_cast<off_t>(inode.contents.size());
  status.st_mtim = timeOf(inode.modified);
  status.st_ctim = timeOf(inode.changed);
  return status;
}

int SimulatedKernel::status(int descriptor, struct stat& status) {
  const int error = begin("fstat", file(descriptor).path);
  if (error == 0) {
    status = statusOf(file(descriptor).inode);
  }
  return error;
}

ssize_t SimulatedKernel::read(std::string_view call, int descriptor, char* bytes, std::size_t count,
                              std::size_t offset) {
  if (const int error = beginOn(call, descriptor); error != 0) {
    return error;
  }
  const SimulatedInode& inode = disk_.inode(file(descriptor).inode);
  if (inode.isDirectory) {
    return -EISDIR;
  }
  const std::string_view contents = inode.contents;
  return static_cast<ssize_t>(
      contents.substr(std::min(offset, contents.size())).copy(bytes, count));
}

ssize_t SimulatedKernel::read(int descriptor, char* bytes, std::size_t count) {
  const ssize_t taken = read("read", descriptor, bytes, count, file(descriptor).offset);
  file(descriptor).offset += static_cast<std::size_t>(std::max(taken, ssize_t{0}));
  return taken;
}

ssize_t SimulatedKernel::readAt(int descriptor, char* bytes, std::size_t count,
                                std::size_t offset) {
  return read("pread", descriptor, bytes, count, offset);
}

ssize_t SimulatedKernel::write(std::string_view call, int descriptor, std::string_view bytes,
                               std::size_t offset) {
  const std::size_t number = operationCount_;
  if (const int error = beginOn(call, descriptor); error != 0) {
    return error;
  }
  if ((file(descriptor).flags & O_ACCMODE) == O_RDONLY) {
    return -EBADF;
  }
  if (fault_ && fault_->error == 0 && number == fault_->operation) {
    bytes = bytes.substr(0, bytes.size() / 2);
    isDiskFull_ = true;
  }
  change({.kind = Kind::Write,
          .inode = file(descriptor).inode,
          .bytes = std::string(bytes),
          .number = offset});
  return static_cast<ssize_t>(bytes.size());
}

ssize_t SimulatedKernel::write(int descriptor, std::string_view bytes) {
  const ssize_t written = write("write", descriptor, bytes, file(descriptor).offset);
  file(descriptor).offset += static_cast<std::size_t>(std::max(written, ssize_t{0}));
  return written;
}

ssize_t SimulatedKernel::writeAt(int descriptor, std::string_view bytes, std::size_t offset) {
  return write("pwrite", descriptor, bytes, offset);
}

int SimulatedKernel::synchronize(std::string_view call, int descriptor) {
  const int error = beginOn(call, descriptor);
  if (error == 0) {
    change({.kind = Kind::Synchronize, .inode = file(descriptor).inode});
  }
  return error;
}

int SimulatedKernel::truncate(int descriptor, std::size_t size) {
  const int error = beginToChange("ftruncate", descriptor);
  // A file of that size already does not change.
  if (error == 0 && disk_.inode(file(descriptor).inode).contents.size() != size) {
    change({.kind = Kind::Truncate, .inode = file(descriptor).inode, .number = size});
  }
  return error;
}

int SimulatedKernel::setPermissions(int descriptor, unsigned permissions) {
  const int error = beginToChange("fchmod", descriptor);
  if (error == 0) {
    change({.kind = Kind::SetPermissions, .inode = file(descriptor).inode, .number = permissions});
  }
  return error;
}

int SimulatedKernel::setOwner(int descriptor, unsigned owner, unsigned group) {
  const int error = beginToChange("fchown", descriptor);
  if (error == 0) {
    const SimulatedInode& inode = disk_.inode(file(descriptor).inode);
    constexpr unsigned kAsItIs = static_cast<unsigned>(-1);
    change({.kind = Kind::SetOwner,
            .inode = file(descriptor).inode,
            .number = owner != kAsItIs ? owner : inode.owner,
            .group = group != kAsItIs ? group : inode.group});
  }
  return error;
}

int SimulatedKernel::setTimes(int descriptor, const timespec* times) {
  const int error = beginToChange("futimens", descriptor);
  if (error != 0 ||
      (times != nullptr && times[0].tv_nsec == UTIME_OMIT && times[1].tv_nsec == UTIME_OMIT)) {
    return error;
  }
  std::uint64_t modified = 0;
  if (times != nullptr && times[1].tv_nsec == UTIME_OMIT) {
    modified = disk_.inode(file(descriptor).inode).modified;
  } else if (times != nullptr && times[1].tv_nsec != UTIME_NOW) {
    modified = nanosecondsOf(times[1]);
  }
  change({.kind = Kind::SetModified, .inode = file(descriptor).inode, .modified = modified});
  return 0;
}

int SimulatedKernel::flags(int descriptor, int& flags) {
  const int error = beginOn("ioctl", descriptor);
  if (error == 0 && !abilities_.hasFlags) {
    return -ENOTTY;
  }
  if (error == 0) {
    flags = disk_.inode(file(descriptor).inode).isImmutable ? FS_IMMUTABLE_FL : 0;
  }
  return error;
}

int SimulatedKernel::readNames(int descriptor, std::vector<std::string>& names) {
  if (const int error = beginOn("getdents", descriptor); error != 0) {
    return error;
  }
  names = {".", ".."};
  for (const auto& [name, inode] : disk_.inode(file(descriptor).inode).entries) {
    names.push_back(name);
  }
  return 0;
}

}  // namespace accounts
