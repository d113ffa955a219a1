#pragma once

#include <array>
#include <cstdint>
#include <functional>
#include <memory>
#include <optional>
#include <string>
#include <string_view>

#include "platform/FileIdentity.h"
#include "platform/Result.h"
#include "vocabulary/DevicePlaces.h"

namespace accounts {

/// Bytes that can be read any number of times, such as those of an open file.
class ReadableBytes {
 public:
  /// Takes the next piece; false if it wants no more.
  using Taker = std::function<bool(std::string_view)>;

  virtual ~ReadableBytes() = default;

  /// Passes the bytes to `take`, piece by piece, until it wants no more. A failure when they cannot
  /// be read; pieces may have been passed before.
  virtual Result giveTo(const Taker& take) const = 0;
};

/// Who a file belongs to, as numbers.
struct FileOwner {
  std::uint32_t user = 0;
  std::uint32_t group = 0;
  bool operator==(const FileOwner&) const = default;
};

/// What stood at a place when a snapshot was taken, and what could be done with it then.
struct PlaceState {
  /// The device path.
  std::string path;
  /// What stands under the name itself.
  FileIdentity identity;
  /// Permission bits of a file that stands there, symbolic links followed; 0 for none.
  unsigned permissions = 0;
  /// What the path leads to, symbolic links followed.
  EntryKind target = EntryKind::Nothing;
  /// The contents of the regular file that the path leads to; null when there is none.
  std::shared_ptr<const ReadableBytes> contents;
  /// Why the path cannot be read as a file; set exactly when `contents` is null.
  std::optional<Failure> whyNotRead;
  /// Why no file could be made under the name or put in the place of what has it: the directory
  /// is missing, may not be written, or something stands there that no file replaces.
  std::optional<Failure> whyNotReplaced;
  /// Why what has the name could not be removed; also when nothing has it.
  std::optional<Failure> whyNotRemoved;
  /// For a directory: why it could not be made.
  std::optional<Failure> whyNotMade;
};

/// The places of a device at one moment: all that a migration in memory knows of its files.
struct DeviceSnapshot {
  std::array<PlaceState, kDevicePlaceCount> places;
  /// Whether some of them are on a mount that may only be read.
  bool isReadOnly = false;

  [[nodiscard]] const PlaceState& at(DevicePlace place) const { return places[indexOf(place)]; }
};

}  // namespace accounts
