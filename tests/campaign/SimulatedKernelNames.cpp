// What the simulated kernel does with names in open directories.

#include <fcntl.h>
#include <unistd.h>

#include <cerrno>
#include <utility>

#include "tests/campaign/SimulatedKernel.h"

namespace accounts {

namespace {

using Kind = DiskChange::Kind;

}  // namespace

int SimulatedKernel::mayChange(const Place& place) const {
  const bool isImmutable = disk_.inode(place.directory).isImmutable ||
                           (place.inode && disk_.inode(*place.inode).isImmutable);
  return isImmutable ? -EPERM : 0;
}

int SimulatedKernel::statusAt(int directory, std::string_view name, struct stat& status,
                              int flags) {
  if (const int error = begin("fstatat", pathIn(directory, name)); error != 0) {
    return error;
  }
  const Place there = place(directory, name);
  if (!there.inode || (name.empty() && (flags & AT_EMPTY_PATH) == 0)) {
    return -ENOENT;
  }
  status = statusOf(*there.inode);
  return 0;
}

int SimulatedKernel::access(int directory, std::string_view name, int mode, int flags) {
  if (const int error = begin("faccessat", pathIn(directory, name)); error != 0) {
    return error;
  }
  const Place there = place(directory, name);
  if (!there.inode || (name.empty() && (flags & AT_EMPTY_PATH) == 0)) {
    return -ENOENT;
  }
  return (mode & W_OK) != 0 && disk_.inode(*there.inode).isImmutable ? -EPERM : 0;
}

int SimulatedKernel::rename(int directory, std::string_view name, int newDirectory,
                            std::string_view newName, unsigned flags) {
  const std::string_view call = flags != 0 ? "renameat2" : "renameat";
  if (const int error = begin(call, pathIn(newDirectory, newName)); error != 0) {
    return error;
  }
  const Place from = place(directory, name);
  const Place to = place(newDirectory, newName);
  const bool isExchange = (flags & RENAME_EXCHANGE) != 0;
  if (!from.inode || (isExchange && !to.inode)) {
    return -ENOENT;
  }
  if ((flags & RENAME_NOREPLACE) != 0 && to.inode) {
    return -EEXIST;
  }
  for (const Place* each : {&from, &to}) {
    if (const int error = mayChange(*each); error != 0) {
      return error;
    }
  }
  if (from.inode == to.inode) {
    // Two names of one file: POSIX wants nothing to happen, whatever was asked for.
    return 0;
  }
  if (isExchange) {
    return exchange(from, to);
  }
  if ((flags & RENAME_NOREPLACE) != 0 && !abilities_.sparesNames) {
    return -EINVAL;
  }
  const bool isDirectory = disk_.inode(*from.inode).isDirectory;
  if (to.inode && disk_.inode(*to.inode).isDirectory != isDirectory) {
    return isDirectory ? -ENOTDIR : -EISDIR;
  }
  if (to.inode && !disk_.inode(*to.inode).entries.empty()) {
    return -ENOTEMPTY;
  }
  change({.kind = Kind::Rename,
          .inode = *from.inode,
          .directory = from.directory,
          .name = from.name,
          .newDirectory = to.directory,
          .newName = to.name});
  return 0;
}

int SimulatedKernel::exchange(const Place& one, const Place& other) {
  if (!abilities_.exchangesNames) {
    return -EINVAL;
  }
  change({.kind = Kind::Exchange,
          .inode = *one.inode,
          .directory = one.directory,
          .name = one.name,
          .newDirectory = other.directory,
          .newName = other.name,
          .otherInode = *other.inode});
  return 0;
}

int SimulatedKernel::unlink(int directory, std::string_view name, int flags) {
  if (const int error = begin("unlinkat", pathIn(directory, name)); error != 0) {
    return error;
  }
  const Place there = place(directory, name);
  if (!there.inode) {
    return -ENOENT;
  }
  if (const int error = mayChange(there); error != 0) {
    return error;
  }
  const bool removesDirectory = (flags & AT_REMOVEDIR) != 0;
  if (disk_.inode(*there.inode).isDirectory != removesDirectory) {
    return removesDirectory ? -ENOTDIR : -EISDIR;
  }
  if (!disk_.inode(*there.inode).entries.empty()) {
    return -ENOTEMPTY;
  }
  change({.kind = Kind::Unlink,
          .inode = *there.inode,
          .directory = there.directory,
          .name = there.name});
  return 0;
}

int SimulatedKernel::link(int directory, std::string_view name, int newDirectory,
                          std::string_view newName, int flags) {
  if (const int error = begin("linkat", pathIn(newDirectory, newName)); error != 0) {
    return error;
  }
  const Place from = place(directory, name);
  const Place to = place(newDirectory, newName);
  if (!from.inode || (name.empty() && (flags & AT_EMPTY_PATH) == 0)) {
    return -ENOENT;
  }
  if (to.inode) {
    return -EEXIST;
  }
  const SimulatedInode& inode = disk_.inode(*from.inode);
  if (inode.isDirectory || inode.isImmutable) {
    return -EPERM;
  }
  if (const int error = mayChange(to); error != 0) {
    return error;
  }
  if (inode.links == 0) {
    // What has lost its last name gets no other.
    return -ENOENT;
  }
  change({.kind = Kind::Link, .inode = *from.inode, .directory = to.directory, .name = to.name});
  return 0;
}

int SimulatedKernel::makeDirectory(int directory, std::string_view name, unsigned permissions) {
  if (const int error = begin("mkdirat", pathIn(directory, name)); error != 0) {
    return error;
  }
  const Place there = place(directory, name);
  if (there.inode) {
    return -EEXIST;
  }
  if (const int error = mayChange(there); error != 0) {
    return error;
  }
  const std::size_t inode = allocate(true, permissions);
  change({.kind = Kind::Link, .inode = inode, .directory = there.directory, .name = there.name});
  return 0;
}

}  // namespace accounts
