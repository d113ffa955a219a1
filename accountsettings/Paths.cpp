#include "accountsettings/Paths.h"

namespace accounts {

namespace {

constexpr char separator = '/';

}  // namespace

std::string pathByAppending(std::string_view path, std::string_view component) {
  while (path.ends_with(separator)) {
    path.remove_suffix(1);
  }
  while (component.starts_with(separator)) {
    component.remove_prefix(1);
  }
  std::string joined(path);
  joined += separator;
  joined += component;
  return joined;
}

std::string lastPathComponent(std::string_view path) {
  const std::size_t lastSeparator = path.rfind(separator);
  return std::string(lastSeparator == std::string_view::npos ? path
                                                             : path.substr(lastSeparator + 1));
}

}  // namespace accounts
