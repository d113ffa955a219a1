#pragma once

#include <string>

namespace accounts {

/// The mail application's data directory.
class MailDirectory {
 public:
  virtual ~MailDirectory() = default;

  /// Its absolute device path, without a trailing separator.
  virtual std::string path() = 0;
};

}  // namespace accounts
