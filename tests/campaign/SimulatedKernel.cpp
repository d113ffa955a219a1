#include "tests/campaign/SimulatedKernel.h"

#include <fcntl.h>
#include <sys/file.h>
#include <unistd.h>

#include <algorithm>
#include <cerrno>
#include <utility>

namespace accounts {

namespace {

// System calls have no other way to find it.
SimulatedKernel* currentKernel = nullptr;

constexpr dev_t kDevice = 0xacc;

using Kind = DiskChange::Kind;

}  // namespace

SimulatedKernel::SimulatedKernel(SimulatedDisk disk, unsigned run)
    : disk_(std::move(disk)), randomNumber_(std::uint64_t{run} << 32U) {
  currentKernel = this;
}

SimulatedKernel::~SimulatedKernel() {
  currentKernel = nullptr;
}

SimulatedKernel* SimulatedKernel::current() {
  return currentKernel;
}

void SimulatedKernel::start(const std::optional<Fault>& fault, Recording recording) {
  fault_ = fault;
  isRecording_ = recording == Recording::On;
  operationCount_ = 0;
}

bool SimulatedKernel::endPlugin() {
  const bool hasHit = fault_ && fault_->duration == Fault::Duration::UntilThePluginEnds &&
                      operationCount_ > fault_->operation;
  if (fault_ && fault_->duration == Fault::Duration::UntilThePluginEnds) {
    fault_.reset();
  }
  return hasHit;
}

std::size_t SimulatedKernel::openDescriptors() const {
  return static_cast<std::size_t>(std::ranges::count_if(files_, &OpenFile::isOpen));
}

int SimulatedKernel::begin(std::string_view call, const std::string& path) {
  const std::size_t number = operationCount_++;
  if (isRecording_) {
    calls_.push_back({std::string(call) + " " + path, changes_.size()});
  }
  if (!fault_ || number < fault_->operation) {
    return 0;
  }
  if (fault_->error != 0) {
    const bool isHit = number == fault_->operation || fault_->duration != Fault::Duration::Once;
    if (isHit) {
      refusedPaths_.push_back(path);
    }
    return isHit ? -fault_->error : 0;
  }
  if (call == "write" && isDiskFull_) {
    isDiskFull_ = fault_->duration == Fault::Duration::FromThenOn;
    refusedPaths_.push_back(path);
    return -ENOSPC;
  }
  return 0;
}

void SimulatedKernel::change(DiskChange change) {
  disk_.apply(change);
  if (isRecording_) {
    changes_.push_back(std::move(change));
  }
}

std::size_t SimulatedKernel::allocate(bool isDirectory, unsigned permissions) {
  const std::size_t number = disk_.nextInode();
  change(
      {.kind = Kind::Allocate, .inode = number, .number = permissions, .isDirectory = isDirectory});
  return number;
}

int SimulatedKernel::addDescriptor(std::size_t inode, std::string path) {
  files_.push_back({.inode = inode, .path = std::move(path)});
  return kFirstDescriptor + static_cast<int>(files_.size()) - 1;
}

std::string SimulatedKernel::pathIn(int directory, std::string_view name) {
  const std::string& path = file(directory).path;
  return (path == "/" ? path : path + "/") + std::string(name);
}

std::optional<std::size_t> SimulatedKernel::entry(int directory, std::string_view name) {
  const auto& entries = disk_.inode(file(directory).inode).entries;
  const auto found = entries.find(name);
  return found != entries.end() ? std::optional(found->second) : std::nullopt;
}

int SimulatedKernel::open(std::string_view hostPath) {
  return hostPath == kDeviceDirectory ? addDescriptor(SimulatedDisk::kRoot, "/") : -ENOENT;
}

int SimulatedKernel::openBeneath(int /*directory*/, std::string_view path, int flags) {
  const std::string absolute = path.starts_with('/') ? std::string(path) : "/" + std::string(path);
  if (const int error = begin("openat2", absolute); error != 0) {
    return error;
  }
  const std::optional<std::size_t> inode = disk_.find(absolute);
  if (!inode) {
    return -ENOENT;
  }
  if ((flags & O_DIRECTORY) != 0 && !disk_.inode(*inode).isDirectory) {
    return -ENOTDIR;
  }
  return addDescriptor(*inode, absolute);
}

int SimulatedKernel::openAt(int directory, std::string_view name, int flags, unsigned permissions) {
  if (name == ".") {
    const std::string path = file(directory).path;
    const int error = begin("openat", path);
    return error != 0 ? error : addDescriptor(file(directory).inode, path);
  }
  const std::string path = pathIn(directory, name);
  if (const int error = begin("openat", path); error != 0) {
    return error;
  }
  std::optional<std::size_t> inode = entry(directory, name);
  if (inode && (flags & O_EXCL) != 0) {
    return -EEXIST;
  }
  if (!inode && (flags & O_CREAT) == 0) {
    return -ENOENT;
  }
  if (inode && (flags & O_DIRECTORY) != 0 && !disk_.inode(*inode).isDirectory) {
    return -ENOTDIR;
  }
  if (!inode) {
    inode = allocate(false, permissions);
    change({.kind = Kind::Link,
            .inode = *inode,
            .directory = file(directory).inode,
            .name = std::string(name)});
  }
  return addDescriptor(*inode, path);
}

int SimulatedKernel::status(int descriptor, struct stat& status) {
  if (const int error = begin("fstat", file(descriptor).path); error != 0) {
    return error;
  }
  const std::size_t number = file(descriptor).inode;
  const SimulatedInode& inode = disk_.inode(number);
  status = {};
  status.st_dev = kDevice;
  status.st_ino = number + 1;
  status.st_mode = (inode.isDirectory ? S_IFDIR : S_IFREG) | inode.permissions;
  status.st_nlink = 1;
  status.st_uid = inode.owner;
  status.st_gid = inode.group;
  status.st_size = static_cast<off_t>(inode.contents.size());
  return 0;
}

int SimulatedKernel::statusAt(int directory, std::string_view name, struct stat& result) {
  const std::optional<std::size_t> inode = entry(directory, name);
  if (!inode) {
    const int error = begin("fstatat", pathIn(directory, name));
    return error != 0 ? error : -ENOENT;
  }
  const int descriptor = addDescriptor(*inode, pathIn(directory, name));
  const int given = status(descriptor, result);
  close(descriptor);
  return given;
}

ssize_t SimulatedKernel::read(int descriptor, char* bytes, std::size_t count) {
  if (const int error = begin("read", file(descriptor).path); error != 0) {
    return error;
  }
  OpenFile& open = file(descriptor);
  const std::string_view contents = disk_.inode(open.inode).contents;
  const std::string_view rest = contents.substr(std::min(open.offset, contents.size()));
  const std::size_t taken = rest.copy(bytes, count);
  open.offset += taken;
  return static_cast<ssize_t>(taken);
}

ssize_t SimulatedKernel::write(int descriptor, std::string_view bytes) {
  const std::size_t number = operationCount_;
  if (const int error = begin("write", file(descriptor).path); error != 0) {
    return error;
  }
  if (fault_ && fault_->error == 0 && number == fault_->operation) {
    bytes = bytes.substr(0, bytes.size() / 2);
    isDiskFull_ = true;
  }
  OpenFile& open = file(descriptor);
  change({.kind = Kind::Write,
          .inode = open.inode,
          .bytes = std::string(bytes),
          .number = open.offset});
  open.offset += bytes.size();
  return static_cast<ssize_t>(bytes.size());
}

int SimulatedKernel::synchronize(int descriptor) {
  const int error = begin("fsync", file(descriptor).path);
  if (error == 0) {
    change({.kind = Kind::Synchronize, .inode = file(descriptor).inode});
  }
  return error;
}

int SimulatedKernel::truncate(int descriptor, std::size_t size) {
  const int error = begin("ftruncate", file(descriptor).path);
  // A file of that size already does not change.
  if (error == 0 && disk_.inode(file(descriptor).inode).contents.size() != size) {
    change({.kind = Kind::Truncate, .inode = file(descriptor).inode, .number = size});
  }
  return error;
}

int SimulatedKernel::setPermissions(int descriptor, unsigned permissions) {
  const int error = begin("fchmod", file(descriptor).path);
  if (error == 0) {
    change({.kind = Kind::SetPermissions, .inode = file(descriptor).inode, .number = permissions});
  }
  return error;
}

int SimulatedKernel::setOwner(int descriptor, unsigned owner, unsigned group) {
  const int error = begin("fchown", file(descriptor).path);
  if (error == 0) {
    change(
        {.kind = Kind::SetOwner, .inode = file(descriptor).inode, .number = owner, .group = group});
  }
  return error;
}

int SimulatedKernel::rename(int directory, std::string_view name, int newDirectory,
                            std::string_view newName) {
  if (const int error = begin("renameat", pathIn(newDirectory, newName)); error != 0) {
    return error;
  }
  const std::optional<std::size_t> inode = entry(directory, name);
  if (!inode) {
    return -ENOENT;
  }
  const std::optional<std::size_t> replaced = entry(newDirectory, newName);
  const bool isDirectory = disk_.inode(*inode).isDirectory;
  if (replaced && disk_.inode(*replaced).isDirectory != isDirectory) {
    return isDirectory ? -ENOTDIR : -EISDIR;
  }
  if (replaced && !disk_.inode(*replaced).entries.empty()) {
    return -ENOTEMPTY;
  }
  change({.kind = Kind::Rename,
          .inode = *inode,
          .directory = file(directory).inode,
          .name = std::string(name),
          .newDirectory = file(newDirectory).inode,
          .newName = std::string(newName)});
  return 0;
}

int SimulatedKernel::unlink(int directory, std::string_view name, int flags) {
  if (const int error = begin("unlinkat", pathIn(directory, name)); error != 0) {
    return error;
  }
  const std::optional<std::size_t> inode = entry(directory, name);
  if (!inode) {
    return -ENOENT;
  }
  const bool removesDirectory = (flags & AT_REMOVEDIR) != 0;
  if (disk_.inode(*inode).isDirectory != removesDirectory) {
    return removesDirectory ? -ENOTDIR : -EISDIR;
  }
  if (!disk_.inode(*inode).entries.empty()) {
    return -ENOTEMPTY;
  }
  change({.kind = Kind::Unlink,
          .inode = *inode,
          .directory = file(directory).inode,
          .name = std::string(name)});
  return 0;
}

int SimulatedKernel::link(int directory, std::string_view name, int newDirectory,
                          std::string_view newName) {
  if (const int error = begin("linkat", pathIn(newDirectory, newName)); error != 0) {
    return error;
  }
  const std::optional<std::size_t> inode = entry(directory, name);
  if (!inode) {
    return -ENOENT;
  }
  if (entry(newDirectory, newName)) {
    return -EEXIST;
  }
  change({.kind = Kind::Link,
          .inode = *inode,
          .directory = file(newDirectory).inode,
          .name = std::string(newName)});
  return 0;
}

int SimulatedKernel::readNames(int descriptor, std::vector<std::string>& names) {
  if (const int error = begin("getdents", file(descriptor).path); error != 0) {
    return error;
  }
  names = {".", ".."};
  for (const auto& [name, inode] : disk_.inode(file(descriptor).inode).entries) {
    names.push_back(name);
  }
  return 0;
}

int SimulatedKernel::lock(int descriptor, int operation) {
  OpenFile& locked = file(descriptor);
  if ((operation & LOCK_UN) != 0) {
    locked.isLocked = false;
    return 0;
  }
  const bool isHeld = std::ranges::any_of(files_, [&](const OpenFile& other) {
    return &other != &locked && other.isOpen && other.isLocked && other.inode == locked.inode;
  });
  if (isHeld) {
    return (operation & LOCK_NB) != 0 ? -EWOULDBLOCK : -EDEADLK;
  }
  locked.isLocked = true;
  return 0;
}

int SimulatedKernel::setTimes(int descriptor) {
  return begin("futimens", file(descriptor).path);
}

int SimulatedKernel::makeDirectory(int directory, std::string_view name, unsigned permissions) {
  if (const int error = begin("mkdirat", pathIn(directory, name)); error != 0) {
    return error;
  }
  if (entry(directory, name)) {
    return -EEXIST;
  }
  const std::size_t inode = allocate(true, permissions);
  change({.kind = Kind::Link,
          .inode = inode,
          .directory = file(directory).inode,
          .name = std::string(name)});
  return 0;
}

void SimulatedKernel::close(int descriptor) {
  file(descriptor).isOpen = false;
}

void SimulatedKernel::random(char* bytes, std::size_t count) {
  std::uint64_t number = ++randomNumber_;
  for (std::size_t index = 0; index < count; ++index, number >>= 8U) {
    bytes[index] = static_cast<char>(number & 0xffU);
  }
}

}  // namespace accounts
