#pragma once

#include <cstddef>
#include <cstdint>
#include <map>
#include <optional>
#include <string>
#include <string_view>
#include <vector>

namespace accounts {

/// What a disk knows of one file or directory, apart from its names.
struct SimulatedInode {
  bool isDirectory = false;
  unsigned permissions = 0644;
  unsigned owner = 0;
  unsigned group = 0;
  /// Of a file.
  std::string contents = {};
  /// Of a directory: inode numbers by name.
  std::map<std::string, std::size_t, std::less<>> entries = {};
};

/// One step that changes a disk, or that waits until earlier ones are on the medium. System calls
/// are made of these: creating a file is Allocate and then Link.
struct DiskChange {
  enum class Kind : std::uint8_t {
    /// `inode` is new; `isDirectory` and `number` (permission bits) say what it is.
    Allocate,
    /// `directory` gets the name `name` for `inode`, in place of what had it.
    Link,
    /// `directory` loses the name `name`.
    Unlink,
    /// `inode` loses the name `name` in `directory` and gets `newName` in `newDirectory`, in place
    /// of what had it, in one step.
    Rename,
    /// The contents of `inode` get `bytes` at the offset `number`.
    Write,
    /// The contents of `inode` are cut to `number` bytes.
    Truncate,
    /// The permission bits of `inode` become `number`.
    SetPermissions,
    /// `inode` belongs to the user `number` and the group `group`.
    SetOwner,
    /// What was done to `inode` before is on the medium: a file's contents, a directory's names.
    Synchronize,
  };
  Kind kind = Kind::Synchronize;
  std::size_t inode = 0;
  std::size_t directory = 0;
  std::string name = {};
  std::size_t newDirectory = 0;
  std::string newName = {};
  std::string bytes = {};
  std::size_t number = 0;
  unsigned group = 0;
  bool isDirectory = false;

  /// Whether this concerns a name in a directory.
  [[nodiscard]] bool isOfNames() const {
    return kind == Kind::Link || kind == Kind::Unlink || kind == Kind::Rename;
  }
  /// Whether this concerns the contents of a file.
  [[nodiscard]] bool isOfContents() const { return kind == Kind::Write || kind == Kind::Truncate; }
};

/// A disk in memory: a tree of files and directories without symbolic links. A value: copies are
/// independent.
class SimulatedDisk {
 public:
  static constexpr std::size_t kRoot = 0;

  /// A disk with an empty root directory.
  SimulatedDisk();

  /// Adds a directory and its missing parents.
  void addDirectory(std::string_view path);
  /// Adds a file, with its missing parents, or replaces its contents.
  void addFile(std::string_view path, std::string contents);
  /// Takes a file away if it is there.
  void removeFile(std::string_view path);

  /// The inode at an absolute path; none when nothing is there.
  [[nodiscard]] std::optional<std::size_t> find(std::string_view path) const;
  [[nodiscard]] bool exists(std::string_view path) const { return find(path).has_value(); }
  /// The contents of the file at a path; none when there is no file.
  [[nodiscard]] std::optional<std::string> contentsOf(std::string_view path) const;
  /// The paths of all files beneath a directory, in order.
  [[nodiscard]] std::vector<std::string> filesBeneath(std::string_view directory) const;

  [[nodiscard]] const SimulatedInode& inode(std::size_t number) const { return inodes_[number]; }
  /// The number that the next allocated inode gets.
  [[nodiscard]] std::size_t nextInode() const { return inodes_.size(); }

  /// Makes a change. It must fit the disk: inodes that it names have been allocated.
  void apply(const DiskChange& change);
  /// Replaces the contents of a file by its inode.
  void setContents(std::size_t number, std::string contents) {
    inodes_[number].contents = std::move(contents);
  }

  /// The same for two disks whose trees hold the same names, contents, permissions and owners.
  [[nodiscard]] std::uint64_t fingerprint() const;

 private:
  std::vector<SimulatedInode> inodes_;
};

}  // namespace accounts
