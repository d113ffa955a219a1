#pragma once

#include <string>
#include <string_view>

namespace accounts {

/// A path with a component appended, joined by exactly one separator. An empty path gives an
/// absolute one.
std::string pathByAppending(std::string_view path, std::string_view component);

/// What stands behind the last separator of a path.
std::string lastPathComponent(std::string_view path);

}  // namespace accounts
