#pragma once

#include <gtest/gtest.h>

#include <stdexcept>
#include <string>
#include <string_view>
#include <vector>

#include "propertylist/binary/BinaryPropertyListSerializer.h"
#include "tests/fakes/FakeSnapshot.h"
#include "transaction/TransactionFileSystem.h"

namespace accounts {

/// Files can be given to user 501 and group 502, who are called "mobile".
class MobileAlone final : public OwnershipRule {
 public:
  OrFailure<FileOwner> ownerNamed(std::string_view ownerName, std::string_view groupName) override {
    if (ownerName == "mobile" && groupName == "mobile") {
      return FileOwner{501, 502};
    }
    return Failure{EPERM, "Not to " + std::string(ownerName)};
  }
};

/// Thrown in place of ending the program.
struct MetForeignPath {
  std::string path;
};

inline constexpr std::string_view kHome = "/var/mobile";

/// A list of a value as it is written.
inline SerializedPropertyList serialized(const PropertyValue& value) {
  return BinaryPropertyListSerializer().serialize(value).value();
}

/// A migration in memory over a snapshot that a test makes before it uses anything else.
class TransactionTest : public testing::Test {
 protected:
  static std::string path(DevicePlace place) { return pathOfPlace(place, kHome); }

  /// Writes and renames as a save of the settings file does.
  Result save(const PropertyValue& value) {
    const std::string temporary = files.makeTemporaryFile().value();
    if (Result written = files.writeFile(temporary, serialized(value)); !written) {
      return written;
    }
    return files.renameFile(temporary, path(DevicePlace::Settings));
  }

  /// Each change as a word and the name of its place.
  [[nodiscard]] std::vector<std::string> changes() const {
    std::vector<std::string> lines;
    for (const PlaceChange& each : transaction.changes()) {
      const std::string what =
          std::holds_alternative<PlaceChange::Removed>(each.contents)          ? "remove "
          : std::holds_alternative<PlaceChange::CopyOfSettings>(each.contents) ? "copy "
          : std::holds_alternative<PlaceChange::EmptyDirectory>(each.contents) ? "make "
                                                                               : "write ";
      lines.push_back(what + std::string(listed(each.place).name));
    }
    return lines;
  }

  FakeSnapshot snapshot;
  Transaction transaction{snapshot, kHome};
  MobileAlone ownership;
  TransactionFileSystem files{transaction, ownership, [](std::string_view path) {
                                throw MetForeignPath{std::string(path)};
                              }};
};

}  // namespace accounts
