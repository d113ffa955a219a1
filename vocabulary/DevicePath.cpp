#include "vocabulary/DevicePath.h"

namespace accounts {

std::string_view withoutTrailingSeparators(std::string_view path) {
  while (path.size() > 1 && path.ends_with('/')) {
    path.remove_suffix(1);
  }
  return path;
}

std::string joinedPath(std::string_view path, std::string_view component) {
  std::string joined(withoutTrailingSeparators(path));
  if (!joined.ends_with('/')) {
    joined += '/';
  }
  while (component.starts_with('/')) {
    component.remove_prefix(1);
  }
  return joined.append(component);
}

SplitPath splitPath(std::string_view path) {
  path = withoutTrailingSeparators(path);
  const std::size_t separator = path.rfind('/');
  if (separator == std::string_view::npos) {
    return {"/", path};
  }
  const std::string_view directory = withoutTrailingSeparators(path.substr(0, separator + 1));
  return {directory, path.substr(separator + 1)};
}

}  // namespace accounts
