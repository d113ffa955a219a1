#pragma once

#include <map>
#include <optional>
#include <string>
#include <utility>

#include "platform/linux/PathFailure.h"

namespace accounts {

/// The files of a bundle's Resources directory, on the host, outside any device root. Names are
/// relative to the directory.
class BundleFiles {
 public:
  explicit BundleFiles(std::string directory) : directory_(std::move(directory)) {}

  /// Reads everything there is now, so that nothing needs to be opened later. What comes into the
  /// directory afterwards is not seen. An error when this machine's want or its medium keeps
  /// something from being read.
  Result readAhead();

  [[nodiscard]] bool exists(const std::string& name) const;
  /// The bytes of a regular file.
  [[nodiscard]] OrFailure<std::string> read(const std::string& name) const;

 private:
  [[nodiscard]] std::string pathOf(const std::string& name) const;

  std::string directory_;
  /// By name; none as long as files are opened when they are asked for.
  std::optional<std::map<std::string, OrFailure<std::string>>> found_;
};

}  // namespace accounts
