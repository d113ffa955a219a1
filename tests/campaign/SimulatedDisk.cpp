#include "tests/campaign/SimulatedDisk.h"

#include <algorithm>
#include <functional>
#include <utility>

#include "vocabulary/DevicePath.h"

namespace accounts {

namespace {

using Kind = DiskChange::Kind;

void addFilesBeneath(const SimulatedDisk& disk, std::size_t directory, const std::string& path,
                     std::vector<std::string>& files) {
  for (const auto& [name, number] : disk.inode(directory).entries) {
    const std::string entryPath = (path == "/" ? path : path + "/") + name;
    if (disk.inode(number).isDirectory) {
      addFilesBeneath(disk, number, entryPath, files);
    } else {
      files.push_back(entryPath);
    }
  }
}

/// A hash of a sequence of texts and numbers.
class Fingerprint {
 public:
  void add(std::string_view text) { add(std::hash<std::string_view>()(text)); }
  void add(std::uint64_t number) {
    constexpr std::uint64_t factor = 0x9e3779b97f4a7c15U;
    value_ = (value_ ^ number) * factor;
    value_ ^= value_ >> 32U;
  }
  [[nodiscard]] std::uint64_t value() const { return value_; }

 private:
  std::uint64_t value_ = 0;
};

void addTree(Fingerprint& fingerprint, const SimulatedDisk& disk, std::size_t number) {
  const SimulatedInode& inode = disk.inode(number);
  fingerprint.add(std::uint64_t{inode.isDirectory});
  fingerprint.add(inode.permissions);
  fingerprint.add(inode.owner);
  fingerprint.add(inode.group);
  fingerprint.add(inode.contents);
  // A directory's own time is nobody's business, and neither is when an inode changed otherwise.
  if (!inode.isDirectory) {
    fingerprint.add(inode.number);
    fingerprint.add(inode.modified);
  }
  fingerprint.add(inode.entries.size());
  for (const auto& [name, entry] : inode.entries) {
    fingerprint.add(name);
    addTree(fingerprint, disk, entry);
  }
}

}  // namespace

SimulatedDisk::SimulatedDisk() {
  add({.isDirectory = true, .permissions = 0755, .links = 1});
}

std::size_t SimulatedDisk::add(SimulatedInode inode) {
  inode.modified = inode.changed = ++clock_;
  inode.number = freeNumber({});
  inodes_.push_back(std::move(inode));
  return inodes_.size() - 1;
}

std::uint64_t SimulatedDisk::freeNumber(const std::set<std::size_t>& inUse) const {
  std::set<std::uint64_t> taken;
  for (std::size_t index = 0; index < inodes_.size(); ++index) {
    if (inodes_[index].links != 0 || inUse.contains(index)) {
      taken.insert(inodes_[index].number);
    }
  }
  std::uint64_t number = 1;
  while (taken.contains(number)) {
    ++number;
  }
  return number;
}

bool SimulatedDisk::hasDistinctNumbers() const {
  std::set<std::uint64_t> seen;
  return std::ranges::all_of(inodes_, [&](const SimulatedInode& inode) {
    return inode.links == 0 || seen.insert(inode.number).second;
  });
}

void SimulatedDisk::addDirectory(std::string_view path) {
  if (exists(path)) {
    return;
  }
  const auto [parent, name] = splitPath(path);
  addDirectory(parent);
  const std::size_t number = add({.isDirectory = true, .permissions = 0755});
  give(*find(parent), std::string(name), number, clock_);
}

void SimulatedDisk::addFile(std::string_view path, std::string contents) {
  const auto [parent, name] = splitPath(path);
  addDirectory(parent);
  const std::size_t number = add({.contents = std::move(contents)});
  give(*find(parent), std::string(name), number, clock_);
}

void SimulatedDisk::removeFile(std::string_view path) {
  const auto [parent, name] = splitPath(path);
  if (const std::optional<std::size_t> directory = find(parent)) {
    take(*directory, std::string(name), ++clock_);
  }
}

void SimulatedDisk::give(std::size_t directory, const std::string& name, std::size_t number,
                         std::uint64_t time) {
  take(directory, name, time);
  inodes_[directory].entries.emplace(name, number);
  SimulatedInode& inode = inodes_[number];
  inode.changed = std::max(inode.changed, time);
  ++inode.links;
}

void SimulatedDisk::take(std::size_t directory, const std::string& name, std::uint64_t time) {
  SimulatedInode& parent = inodes_[directory];
  parent.modified = std::max(parent.modified, time);
  parent.changed = std::max(parent.changed, time);
  const auto entry = parent.entries.find(name);
  if (entry == parent.entries.end()) {
    return;
  }
  SimulatedInode& inode = inodes_[entry->second];
  inode.changed = std::max(inode.changed, time);
  --inode.links;
  parent.entries.erase(entry);
}

std::optional<std::size_t> SimulatedDisk::find(std::string_view path) const {
  std::size_t number = kRoot;
  for (path.remove_prefix(1); !path.empty();) {
    const std::string_view name = path.substr(0, path.find('/'));
    const auto entry = inodes_[number].entries.find(name);
    if (entry == inodes_[number].entries.end()) {
      return std::nullopt;
    }
    number = entry->second;
    path.remove_prefix(name.size() == path.size() ? name.size() : name.size() + 1);
  }
  return number;
}

std::optional<std::string> SimulatedDisk::contentsOf(std::string_view path) const {
  const std::optional<std::size_t> number = find(path);
  return number && !inodes_[*number].isDirectory ? std::optional(inodes_[*number].contents)
                                                 : std::nullopt;
}

std::vector<std::string> SimulatedDisk::filesBeneath(std::string_view directory) const {
  std::vector<std::string> files;
  if (const std::optional<std::size_t> number = find(directory)) {
    addFilesBeneath(*this, *number, std::string(directory), files);
  }
  return files;
}

void SimulatedDisk::make(DiskChange& change, const std::set<std::size_t>& inUse) {
  change.time = clock_ + 1;
  if (change.kind == Kind::Allocate) {
    change.inodeNumber = freeNumber(inUse);
  }
  if (change.kind == Kind::SetModified && change.modified == 0) {
    change.modified = change.time;
  }
  apply(change);
}

void SimulatedDisk::apply(const DiskChange& change) {
  clock_ = std::max(clock_, change.time);
  switch (change.kind) {
    case Kind::Allocate:
      inodes_.push_back({.isDirectory = change.isDirectory,
                         .permissions = static_cast<unsigned>(change.number),
                         .modified = change.time,
                         .changed = change.time,
                         .number = change.inodeNumber});
      return;
    case Kind::Link:
      give(change.directory, change.name, change.inode, change.time);
      return;
    case Kind::Unlink:
      take(change.directory, change.name, change.time);
      return;
    case Kind::Rename: {
      // A name that was used again meanwhile is not this file's any more.
      const auto& entries = inodes_[change.directory].entries;
      const auto old = entries.find(change.name);
      if (old != entries.end() && old->second == change.inode) {
        take(change.directory, change.name, change.time);
      }
      give(change.newDirectory, change.newName, change.inode, change.time);
      return;
    }
    case Kind::Exchange:
      give(change.directory, change.name, change.otherInode, change.time);
      give(change.newDirectory, change.newName, change.inode, change.time);
      return;
    case Kind::Synchronize:
      return;
    default:
      applyToInode(change);
  }
}

void SimulatedDisk::applyToInode(const DiskChange& change) {
  SimulatedInode& inode = inodes_[change.inode];
  inode.changed = std::max(inode.changed, change.time);
  if (change.isOfContents()) {
    inode.modified = change.time;
  }
  switch (change.kind) {
    case Kind::Write:
      inode.contents.resize(std::max(inode.contents.size(), change.number + change.bytes.size()));
      inode.contents.replace(change.number, change.bytes.size(), change.bytes);
      return;
    case Kind::Truncate:
      inode.contents.resize(change.number);
      return;
    case Kind::SetPermissions:
      inode.permissions = static_cast<unsigned>(change.number);
      return;
    case Kind::SetOwner:
      inode.owner = static_cast<unsigned>(change.number);
      inode.group = change.group;
      return;
    case Kind::SetModified:
      inode.modified = change.modified;
      return;
    default:
      return;
  }
}

std::uint64_t SimulatedDisk::fingerprint() const {
  Fingerprint fingerprint;
  addTree(fingerprint, *this, kRoot);
  return fingerprint.value();
}

}  // namespace accounts
