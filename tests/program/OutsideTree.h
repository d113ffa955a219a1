#pragma once

#include <filesystem>
#include <map>
#include <string>
#include <string_view>

namespace accounts {

/// Occurs in every file of an OutsideTree, so that nothing of it can hide in a device root.
inline constexpr const char* kOutsideMark = "from outside the root";

/// A directory of this machine that no migration of another directory may read or change: it is
/// laid out like a device, so that whoever is led here finds just what he looks for.
class OutsideTree {
 public:
  OutsideTree();
  ~OutsideTree();
  OutsideTree(const OutsideTree&) = delete;
  OutsideTree& operator=(const OutsideTree&) = delete;

  /// Where a device path lies in the tree; nothing needs to exist there.
  [[nodiscard]] std::filesystem::path path(std::string_view devicePath) const;

  /// What can be told of each file and directory of the tree, by path: kind, mode, owner, group,
  /// links, size, times and contents. Telling it changes nothing. The times of last access tell of
  /// reading, since they are older than the last changes (unless the file system keeps none).
  [[nodiscard]] std::map<std::string, std::string> contents() const;

 private:
  std::filesystem::path directory_;
};

}  // namespace accounts
