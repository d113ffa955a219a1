#include "tests/campaign/SimulatedKernel.h"

#include <fcntl.h>
#include <sys/file.h>

#include <algorithm>
#include <cerrno>
#include <set>
#include <stdexcept>
#include <utility>

namespace accounts {

namespace {

// System calls have no other way to find it.
SimulatedKernel* currentKernel = nullptr;

/// So often nobody asks for a lock that could get it.
constexpr std::size_t kMostAsked = 10'000;

using Kind = DiskChange::Kind;

bool isForWriting(int flags) {
  return (flags & O_ACCMODE) != O_RDONLY;
}

}  // namespace

SimulatedKernel::SimulatedKernel(SimulatedDisk disk, unsigned run)
    : disk_(std::move(disk)),
      randomNumber_(std::uint64_t{run} << 32U),
      otherProgram_(disk_, [this](DiskChange made) { change(std::move(made)); }) {
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

std::size_t SimulatedKernel::openDescriptors() const {
  return static_cast<std::size_t>(std::ranges::count_if(files_, &OpenFile::isOpen));
}

int SimulatedKernel::begin(std::string_view call, const std::string& path) {
  const std::size_t number = operationCount_++;
  if (intrusion_ && number >= intrusion_->operation &&
      number - intrusion_->operation < intrusion_->count) {
    intrusion_->act(otherProgram_);
  }
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

int SimulatedKernel::beginOn(std::string_view call, int descriptor) {
  const int error = begin(call, file(descriptor).path);
  return error == 0 && (file(descriptor).flags & O_PATH) != 0 ? -EBADF : error;
}

int SimulatedKernel::beginToChange(std::string_view call, int descriptor) {
  const int error = beginOn(call, descriptor);
  return error == 0 && disk_.inode(file(descriptor).inode).isImmutable ? -EPERM : error;
}

void SimulatedKernel::change(DiskChange change) {
  std::set<std::size_t> inUse;
  if (change.kind == Kind::Allocate) {
    for (const OpenFile& file : files_) {
      if (file.isOpen) {
        inUse.insert(file.inode);
      }
    }
  }
  disk_.make(change, inUse);
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

int SimulatedKernel::addDescriptor(std::size_t inode, std::string path, int flags) {
  files_.push_back({.inode = inode, .path = std::move(path), .flags = flags});
  return kFirstDescriptor + static_cast<int>(files_.size()) - 1;
}

std::string SimulatedKernel::pathIn(int directory, std::string_view name) {
  const std::string& path = file(directory).path;
  if (name.empty() || name == ".") {
    return path;
  }
  return (path == "/" ? path : path + "/") + std::string(name);
}

SimulatedKernel::Place SimulatedKernel::place(int directory, std::string_view name) {
  const std::size_t number = file(directory).inode;
  if (name.empty() || name == ".") {
    return {.directory = number, .inode = number};
  }
  const auto& entries = disk_.inode(number).entries;
  const auto entry = entries.find(name);
  return {.directory = number,
          .name = std::string(name),
          .inode = entry != entries.end() ? std::optional(entry->second) : std::nullopt};
}

int SimulatedKernel::open(std::string_view hostPath, int flags) {
  return hostPath == kDeviceDirectory ? addDescriptor(SimulatedDisk::kRoot, "/", flags) : -ENOENT;
}

int SimulatedKernel::openBeneath(std::string_view path, int flags) {
  const std::string absolute = path.starts_with('/') ? std::string(path) : "/" + std::string(path);
  if (const int error = begin("openat2", absolute); error != 0) {
    return error;
  }
  const std::optional<std::size_t> inode = disk_.find(absolute);
  return inode ? openInode(*inode, absolute, flags) : -ENOENT;
}

int SimulatedKernel::openAt(int directory, std::string_view name, int flags, unsigned permissions) {
  const std::string path = pathIn(directory, name);
  if (const int error = begin("openat", path); error != 0) {
    return error;
  }
  const Place there = place(directory, name);
  if (there.inode) {
    return (flags & O_EXCL) != 0 ? -EEXIST : openInode(*there.inode, path, flags);
  }
  if ((flags & O_CREAT) == 0) {
    return -ENOENT;
  }
  if (const int error = mayChange(there); error != 0) {
    return error;
  }
  const std::size_t inode = allocate(false, permissions);
  change({.kind = Kind::Link, .inode = inode, .directory = there.directory, .name = there.name});
  return addDescriptor(inode, path, flags);
}

int SimulatedKernel::openInode(std::size_t number, const std::string& path, int flags) {
  const SimulatedInode& inode = disk_.inode(number);
  if ((flags & O_DIRECTORY) != 0 && !inode.isDirectory) {
    return -ENOTDIR;
  }
  if (isForWriting(flags) && inode.isDirectory) {
    return -EISDIR;
  }
  if (isForWriting(flags) && inode.isImmutable) {
    return -EPERM;
  }
  return addDescriptor(number, path, flags);
}

int SimulatedKernel::close(int descriptor) {
  file(descriptor).isOpen = false;
  return 0;
}

int SimulatedKernel::lock(int descriptor, int operation) {
  OpenFile& locked = file(descriptor);
  if ((operation & LOCK_UN) != 0) {
    locked.isLocked = false;
    return 0;
  }
  const auto another = std::ranges::find(otherLocks_, locked.inode, &HeldLock::inode);
  if (another != otherLocks_.end()) {
    if (another->asked == kMostAsked) {
      throw std::logic_error("the process waits for ever for the lock of " + locked.path);
    }
    if (another->asked++ < another->lock.count) {
      return (operation & LOCK_NB) != 0 ? -EWOULDBLOCK : -EINTR;
    }
    another->lock.act(otherProgram_);
    otherLocks_.erase(another);
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

void SimulatedKernel::random(char* bytes, std::size_t count) {
  std::uint64_t number = ++randomNumber_;
  for (std::size_t index = 0; index < count; ++index, number >>= 8U) {
    bytes[index] = static_cast<char>(number & 0xffU);
  }
}

}  // namespace accounts
