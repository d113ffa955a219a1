#pragma once

#include <string>
#include <string_view>

namespace accounts {

/// A path without the separators at its end; the path of the root itself keeps its one.
std::string_view withoutTrailingSeparators(std::string_view path);

/// A path with a component appended, joined by exactly one separator. An empty path gives an
/// absolute one.
std::string joinedPath(std::string_view path, std::string_view component);

/// A path taken apart at its last separator, separators at its end disregarded.
struct SplitPath {
  /// The directory, "/" when the path names no other.
  std::string_view directory;
  /// The last component; empty for the root itself.
  std::string_view name;
};
SplitPath splitPath(std::string_view path);

}  // namespace accounts
