#pragma once

#include <array>
#include <cstdint>
#include <memory>
#include <optional>
#include <string>
#include <string_view>
#include <variant>
#include <vector>

#include "platform/DeviceSnapshot.h"
#include "propertylist/value/PropertyValue.h"
#include "propertylist/value/SerializedPropertyList.h"

namespace accounts {

/// What a migration did to one place, once it is over: the difference between the snapshot and what
/// stands in memory.
struct PlaceChange {
  struct Removed {};
  /// The place has what the settings file held in the snapshot.
  struct CopyOfSettings {};
  /// The place is a directory that was made, and nothing was put into it.
  struct EmptyDirectory {};
  /// A property list, still a value.
  using Contents = std::variant<Removed, CopyOfSettings, EmptyDirectory, SerializedPropertyList>;

  DevicePlace place = DevicePlace::Settings;
  Contents contents;
  /// Who the file is to belong to; none for whoever makes it.
  std::optional<FileOwner> owner = {};
  /// Of the migration-information file: its name in the directory, which is the place.
  std::string fileName = {};
};

/// What became of the newest save of the settings file.
enum class LastSave : std::uint8_t {
  /// There was none.
  None,
  Failed,
  Written
};

/// The listed places of a device with changes that are in memory alone. A property list that was
/// written stays a value: reading it again gives the same dictionary, without bytes. Paths count as
/// they are written; one that is not listed is none of a migration's business.
class Transaction {
 public:
  /// What stands at a place in memory.
  struct Removed {};
  struct Text {
    std::string bytes;
  };
  struct List {
    SerializedPropertyList list;
    std::optional<FileOwner> owner;
  };
  /// What another place held in the snapshot.
  struct Copy {
    DevicePlace source;
  };
  struct AsItWas {};
  using Standing = std::variant<AsItWas, Removed, Text, List, Copy>;

  /// `snapshot` must outlive this.
  Transaction(const DeviceSnapshot& snapshot, std::string_view home);

  [[nodiscard]] const DeviceSnapshot& snapshot() const { return snapshot_; }
  /// The place with a path; none for a path that is not listed.
  [[nodiscard]] std::optional<DevicePlace> placeOf(std::string_view path) const;
  [[nodiscard]] const Standing& at(DevicePlace place) const { return standing_[indexOf(place)]; }
  void put(DevicePlace place, Standing standing) {
    standing_[indexOf(place)] = std::move(standing);
  }
  /// Whether anything stands at a place, symbolic links followed.
  [[nodiscard]] bool exists(DevicePlace place) const;

  /// The dictionary that a place holds in memory, or held in the snapshot. None when nothing or
  /// something else is there; when what is there cannot be read, `readFailure` says so.
  [[nodiscard]] std::optional<PropertyDictionary> dictionaryAt(DevicePlace place);
  [[nodiscard]] std::optional<PropertyDictionary> dictionaryBefore(DevicePlace place);
  /// The bytes that a place held in the snapshot; none as with dictionaries.
  [[nodiscard]] std::optional<std::string> bytesBefore(DevicePlace place);
  /// Why a file that was there could not be read, the first time; none when all could.
  [[nodiscard]] const std::optional<Failure>& readFailure() const { return readFailure_; }

  /// A save has begun, or ended.
  void noteSave(LastSave save) { lastSave_ = save; }
  [[nodiscard]] LastSave lastSave() const { return lastSave_; }
  /// What a step of a save failed with, the newest; none for no failure.
  void noteSaveFailure(std::string text) { saveFailure_ = std::move(text); }
  [[nodiscard]] const std::optional<std::string>& saveFailure() const { return saveFailure_; }

  void makeInformationDirectory() { madeInformationDirectory_ = true; }
  [[nodiscard]] bool hasInformationDirectory() const;
  void putInformationFile(std::string name, SerializedPropertyList list);

  /// What is to be committed, in the order of the list of places.
  [[nodiscard]] std::vector<PlaceChange> changes() const;

 private:
  const DeviceSnapshot& snapshot_;
  std::array<std::string, kDevicePlaceCount> paths_;
  std::array<Standing, kDevicePlaceCount> standing_;
  struct Decoded {
    bool isDecoded = false;
    std::optional<PropertyDictionary> dictionary;
  };
  /// What was read is not read again.
  std::array<Decoded, kDevicePlaceCount> decoded_;
  std::optional<Failure> readFailure_;
  LastSave lastSave_ = LastSave::None;
  std::optional<std::string> saveFailure_;
  bool madeInformationDirectory_ = false;
  std::string informationFileName_;
  SerializedPropertyList informationFile_;
};

}  // namespace accounts
