#pragma once

#include <cstddef>
#include <cstdint>
#include <map>
#include <optional>
#include <set>
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
  /// When its contents, or the names in it, changed last: by the disk's clock, in nanoseconds.
  std::uint64_t modified = 0;
  /// When anything of it changed last, its names included.
  std::uint64_t changed = 0;
  /// How many names it has.
  unsigned links = 0;
  /// What a file system calls it by. One that is gone for good leaves its number to others.
  std::uint64_t number = 1;
  /// Nobody may change it, its names or, of a directory, the names in it.
  bool isImmutable = false;
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
    /// `inode` with the name `name` in `directory` and `otherInode` with the name `newName` in
    /// `newDirectory` exchange their names in one step.
    Exchange,
    /// The contents of `inode` get `bytes` at the offset `number`.
    Write,
    /// The contents of `inode` are cut to `number` bytes.
    Truncate,
    /// The permission bits of `inode` become `number`.
    SetPermissions,
    /// `inode` belongs to the user `number` and the group `group`.
    SetOwner,
    /// `inode` says that it was modified when `modified` says; 0 is now.
    SetModified,
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
  std::size_t otherInode = 0;
  std::uint64_t modified = 0;
  /// When it was made, by the disk's clock. SimulatedDisk::make() sets it.
  std::uint64_t time = 0;
  /// The number that an allocated inode gets. SimulatedDisk::make() sets it, too.
  std::uint64_t inodeNumber = 0;

  /// Whether this concerns a name in a directory.
  [[nodiscard]] bool isOfNames() const {
    return kind == Kind::Link || kind == Kind::Unlink || isOfTwoNames();
  }
  /// Whether this concerns a name in each of two directories, which may be the same one.
  [[nodiscard]] bool isOfTwoNames() const { return kind == Kind::Rename || kind == Kind::Exchange; }
  /// Whether this concerns the contents of a file.
  [[nodiscard]] bool isOfContents() const { return kind == Kind::Write || kind == Kind::Truncate; }
};

/// A disk in memory: a tree of files and directories without symbolic links. A value: copies are
/// independent. It has a clock that goes on by a nanosecond with each change, so no two changes
/// have the same time, and nothing depends on when a program is run.
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
  /// What the next allocated inode is to this.
  [[nodiscard]] std::size_t nextInode() const { return inodes_.size(); }

  /// Makes a change now, and writes its time into it. It must fit the disk: inodes that it names
  /// have been allocated. The number of an inode without a name goes to the next one, unless it is
  /// among those `inUse`.
  void make(DiskChange& change, const std::set<std::size_t>& inUse = {});
  /// Makes a change that was made, on this disk or on a copy of it, at the time that it says.
  void apply(const DiskChange& change);
  /// Replaces the contents of a file by its inode. It was modified when `modified` says.
  void setContents(std::size_t number, std::string contents, std::uint64_t modified) {
    inodes_[number].contents = std::move(contents);
    inodes_[number].modified = modified;
  }
  /// Makes a file or directory immutable, or not so any more.
  void setImmutable(std::string_view path, bool isImmutable) {
    inodes_[find(path).value()].isImmutable = isImmutable;
  }

  /// Takes the disk out and puts it in again: what stands on it stays, but for the number that the
  /// system calls the disk by.
  void remount() { ++device_; }
  [[nodiscard]] std::uint64_t device() const { return device_; }

  /// Whether no two inodes that have names have one number. So it is on every disk that there is.
  [[nodiscard]] bool hasDistinctNumbers() const;
  /// The same for two disks whose trees hold the same files under the same names: with the same
  /// inode numbers, contents, times of modification, permissions and owners.
  [[nodiscard]] std::uint64_t fingerprint() const;

 private:
  std::size_t add(SimulatedInode inode);
  [[nodiscard]] std::uint64_t freeNumber(const std::set<std::size_t>& inUse) const;
  void give(std::size_t directory, const std::string& name, std::size_t number, std::uint64_t time);
  void take(std::size_t directory, const std::string& name, std::uint64_t time);
  void applyToInode(const DiskChange& change);

  std::vector<SimulatedInode> inodes_;
  std::uint64_t device_ = 0xacc;
  /// 2024 begins, so that nobody takes a time for none.
  std::uint64_t clock_ = 1'704'067'200'000'000'000;
};

}  // namespace accounts
