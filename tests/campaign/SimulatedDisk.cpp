#include "tests/campaign/SimulatedDisk.h"

#include <algorithm>
#include <functional>
#include <utility>

namespace accounts {

namespace {

using Kind = DiskChange::Kind;

struct SplitPath {
  std::string_view directory;
  std::string_view name;
};

SplitPath split(std::string_view path) {
  const std::size_t separator = path.rfind('/');
  return {separator == 0 ? "/" : path.substr(0, separator), path.substr(separator + 1)};
}

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
  fingerprint.add(inode.entries.size());
  for (const auto& [name, entry] : inode.entries) {
    fingerprint.add(name);
    addTree(fingerprint, disk, entry);
  }
}

}  // namespace

SimulatedDisk::SimulatedDisk() : inodes_{{.isDirectory = true, .permissions = 0755}} {}

void SimulatedDisk::addDirectory(std::string_view path) {
  if (exists(path)) {
    return;
  }
  const auto [parent, name] = split(path);
  addDirectory(parent);
  const std::size_t number = nextInode();
  inodes_.push_back({.isDirectory = true, .permissions = 0755});
  inodes_[*find(parent)].entries.emplace(name, number);
}

void SimulatedDisk::addFile(std::string_view path, std::string contents) {
  const auto [parent, name] = split(path);
  addDirectory(parent);
  const std::size_t number = nextInode();
  inodes_.push_back({.contents = std::move(contents)});
  inodes_[*find(parent)].entries.insert_or_assign(std::string(name), number);
}

void SimulatedDisk::removeFile(std::string_view path) {
  const auto [parent, name] = split(path);
  if (const std::optional<std::size_t> directory = find(parent)) {
    inodes_[*directory].entries.erase(std::string(name));
  }
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

void SimulatedDisk::apply(const DiskChange& change) {
  switch (change.kind) {
    case Kind::Allocate:
      inodes_.push_back(
          {.isDirectory = change.isDirectory, .permissions = static_cast<unsigned>(change.number)});
      break;
    case Kind::Link:
      inodes_[change.directory].entries.insert_or_assign(change.name, change.inode);
      break;
    case Kind::Unlink:
      inodes_[change.directory].entries.erase(change.name);
      break;
    case Kind::Rename: {
      // A name that was used again meanwhile is not this file's any more.
      auto& entries = inodes_[change.directory].entries;
      const auto old = entries.find(change.name);
      if (old != entries.end() && old->second == change.inode) {
        entries.erase(old);
      }
      inodes_[change.newDirectory].entries.insert_or_assign(change.newName, change.inode);
      break;
    }
    case Kind::Write: {
      std::string& contents = inodes_[change.inode].contents;
      contents.resize(std::max(contents.size(), change.number + change.bytes.size()));
      contents.replace(change.number, change.bytes.size(), change.bytes);
      break;
    }
    case Kind::Truncate:
      inodes_[change.inode].contents.resize(change.number);
      break;
    case Kind::SetPermissions:
      inodes_[change.inode].permissions = static_cast<unsigned>(change.number);
      break;
    case Kind::SetOwner:
      inodes_[change.inode].owner = static_cast<unsigned>(change.number);
      inodes_[change.inode].group = change.group;
      break;
    case Kind::Synchronize:
      break;
  }
}

std::uint64_t SimulatedDisk::fingerprint() const {
  Fingerprint fingerprint;
  addTree(fingerprint, *this, kRoot);
  return fingerprint.value();
}

}  // namespace accounts
