#include "tests/campaign/OtherProgram.h"

#include <optional>
#include <utility>

#include "vocabulary/DevicePath.h"

namespace accounts {

namespace {

using Kind = DiskChange::Kind;

}  // namespace

void OtherProgram::writeInPlace(std::string_view path, std::string contents) {
  const std::optional<std::size_t> inode = disk_.find(path);
  if (!inode) {
    replace(path, std::move(contents));
    return;
  }
  make_({.kind = Kind::Truncate, .inode = *inode, .number = 0});
  make_({.kind = Kind::Write, .inode = *inode, .bytes = std::move(contents)});
}

void OtherProgram::replace(std::string_view path, std::string contents) {
  const SplitPath split = splitPath(path);
  const std::optional<std::size_t> directory = disk_.find(split.directory);
  if (!directory) {
    return;
  }
  const std::size_t inode = disk_.nextInode();
  make_({.kind = Kind::Allocate, .inode = inode, .number = 0644});
  make_({.kind = Kind::Write, .inode = inode, .bytes = std::move(contents)});
  make_({.kind = Kind::Synchronize, .inode = inode});
  make_({.kind = Kind::Link,
         .inode = inode,
         .directory = *directory,
         .name = std::string(split.name)});
}

void OtherProgram::remove(std::string_view path) {
  if (const std::optional<std::size_t> inode = disk_.find(path)) {
    const SplitPath split = splitPath(path);
    make_({.kind = Kind::Unlink,
           .inode = *inode,
           .directory = disk_.find(split.directory).value(),
           .name = std::string(split.name)});
  }
}

void OtherProgram::bringBack(std::string_view path, const SimulatedDisk& backup) {
  if (const std::optional<std::size_t> copied = backup.find(path)) {
    replace(path, backup.inode(*copied).contents);
    if (const std::optional<std::size_t> inode = disk_.find(path)) {
      make_(
          {.kind = Kind::SetModified, .inode = *inode, .modified = backup.inode(*copied).modified});
    }
  }
}

}  // namespace accounts
