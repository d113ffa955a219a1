#pragma once

#include <cstdint>
#include <filesystem>
#include <optional>
#include <ostream>
#include <string>

namespace accounts {

/// A file system of its own, small enough to be filled, mounted on a directory as long as this
/// lives.
class SmallDisk {
 public:
  enum class Kind : std::uint8_t { Memory, Ext4 };

  /// Mounts a new one. `reason()` says why not, when this system does not allow it.
  SmallDisk(Kind kind, std::filesystem::path directory);
  ~SmallDisk();
  SmallDisk(const SmallDisk&) = delete;
  SmallDisk& operator=(const SmallDisk&) = delete;

  [[nodiscard]] const std::optional<std::string>& reason() const { return reason_; }

  /// Takes all blocks but these, of the file system's own size; what was taken before is given
  /// back.
  void leaveBlocks(std::uint64_t count) const;
  /// The same for inodes: as many files can still be made.
  void leaveInodes(std::uint64_t count) const;
  /// Gives back everything that was taken.
  void makeRoom() const;

 private:
  std::filesystem::path directory_;
  /// What an Ext4 lies in.
  std::filesystem::path image_;
  std::optional<std::string> reason_;
};

inline std::ostream& operator<<(std::ostream& stream, SmallDisk::Kind kind) {
  return stream << (kind == SmallDisk::Kind::Memory ? "Memory" : "Ext4");
}

}  // namespace accounts
