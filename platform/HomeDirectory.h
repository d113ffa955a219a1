#pragma once

#include <string>

namespace accounts {

/// The home directory of the user whose accounts the device holds.
class HomeDirectory {
 public:
  virtual ~HomeDirectory() = default;

  /// Its absolute device path, without a trailing separator.
  virtual std::string path() = 0;
};

}  // namespace accounts
