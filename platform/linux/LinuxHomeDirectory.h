#pragma once

#include <string>
#include <string_view>

#include "platform/HomeDirectory.h"

namespace accounts {

/// A home directory fixed when the process starts.
class LinuxHomeDirectory final : public HomeDirectory {
 public:
  /// `path` is an absolute device path; separators at its end are dropped.
  explicit LinuxHomeDirectory(std::string_view path);

  std::string path() override { return path_; }

 private:
  std::string path_;
};

}  // namespace accounts
