#pragma once

#include <sys/types.h>

#include <filesystem>
#include <map>
#include <string>

namespace accounts {

/// What stands at a path of a device; its times are left out.
struct TreeEntry {
  /// File type and permissions, as stat() has them.
  mode_t mode = 0;
  uid_t owner = 0;
  gid_t group = 0;
  /// A file's bytes, a link's target.
  std::string contents;

  friend bool operator==(const TreeEntry&, const TreeEntry&) = default;
};

/// Everything beneath a device's root, by device path.
using DeviceTree = std::map<std::string, TreeEntry>;

/// Reads everything beneath a root.
DeviceTree treeOf(const std::filesystem::path& root);

/// A path or a text with "TIME" in place of the time in the names of information files.
std::string withoutTime(const std::string& text);

/// Whether a path is an empty directory of a tree.
bool isEmptyDirectory(const DeviceTree& tree, const std::string& path);

}  // namespace accounts
