#pragma once

#include <optional>
#include <string_view>

#include "fuzz/FuzzInput.h"
#include "propertylist/value/PropertyValue.h"
#include "tests/fakes/FakePlatform.h"

namespace accounts {

/// A fake device that says nothing on standard error and reads the bundle's resources once for all
/// devices, since a fuzz target makes thousands a second.
class FuzzedDevice : public FakePlatform {
 public:
  FuzzedDevice();

  /// Puts what the input says at a path: nothing, a file with the contents that `make` makes of the
  /// input, a file of any bytes, or a directory.
  void addAnything(FuzzInput& input, std::string_view path,
                   PropertyDictionary (*make)(FuzzInput& input));

  /// Whether a file or a directory is at a path.
  [[nodiscard]] bool has(std::string_view path) const {
    return fileSystem.files.contains(path) || fileSystem.directories.contains(path);
  }

  /// The account dictionaries in the account settings file. Ends the process with a complaint
  /// unless the file is as a save leaves it: a dictionary of the current version and a list of
  /// accounts with a known type and a class each.
  [[nodiscard]] PropertyArray savedAccounts() const;
};

/// Whether no two of some account dictionaries, children included, have an identifier in common,
/// under whichever key.
bool haveDistinctIdentifiers(const PropertyArray& accounts);

}  // namespace accounts
