#pragma once

#include <map>
#include <set>
#include <string>
#include <string_view>

#include "tests/program/DeviceTree.h"

namespace accounts {

/// Gives the identifiers that a migration made up names of the same length: the first one met
/// becomes number 1 and so on, the same one the same everywhere. So two migrations of one device
/// are compared, of which each made up its own. A made-up identifier has the form of a UUID in
/// capital letters and stands nowhere on the device before.
class FreshIdentifiers {
 public:
  /// `before` is the device before the migration.
  explicit FreshIdentifiers(const DeviceTree& before);

  /// A text, or a file's bytes, with the names in place of the identifiers.
  std::string named(std::string_view bytes);

 private:
  std::set<std::string, std::less<>> known_;
  std::map<std::string, std::string, std::less<>> names_;
};

}  // namespace accounts
