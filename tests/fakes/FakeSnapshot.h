#pragma once

#include <cerrno>
#include <memory>
#include <optional>
#include <string>
#include <string_view>
#include <system_error>
#include <utility>

#include "platform/DeviceSnapshot.h"
#include "propertylist/binary/BinaryPropertyList.h"

namespace accounts {

/// Bytes to read; with a failure set, the ones before it can be read and no more.
class FakeBytes final : public ReadableBytes {
 public:
  explicit FakeBytes(std::string bytes, std::optional<Failure> failure = std::nullopt)
      : bytes_(std::move(bytes)), failure_(std::move(failure)) {}

  Result giveTo(const Taker& take) const override {
    ++readings;
    // In two pieces: nobody may count on getting all at once.
    const std::string_view all = bytes_;
    if (take(all.substr(0, all.size() / 2)) && !failure_) {
      static_cast<void>(take(all.substr(all.size() / 2)));
    }
    return failure_ ? Result(*failure_) : Result();
  }

  /// How often somebody began to read.
  mutable int readings = 0;

 private:
  std::string bytes_;
  std::optional<Failure> failure_;
};

/// The failure that the system gives for an operation on a path.
inline Failure failureOf(std::string_view operation, std::string_view path, int number) {
  return {number,
          std::string("Cannot ").append(operation).append(" ").append(path).append(": ").append(
              std::generic_category().message(number))};
}

/// A snapshot made by hand: at first of a device that has every directory and no file.
struct FakeSnapshot : DeviceSnapshot {
  FakeSnapshot() {
    for (const ListedPlace& each : kDevicePlaces) {
      PlaceState& state = places[indexOf(each.place)];
      state.path = pathOfPlace(each.place, "/var/mobile");
      state.whyNotRead = failureOf("open", state.path, ENOENT);
      state.whyNotRemoved = failureOf("remove", state.path, ENOENT);
    }
  }

  PlaceState& operator[](DevicePlace place) { return places[indexOf(place)]; }
  [[nodiscard]] std::string pathOf(DevicePlace place) const { return at(place).path; }

  /// Something stands at a place that is no regular file.
  void addEntry(DevicePlace place, EntryKind kind) {
    PlaceState& state = (*this)[place];
    state.identity.kind = kind;
    state.identity.device = 1;
    state.identity.inode = 100 + indexOf(place);
    state.target = kind;
    state.whyNotRemoved.reset();
    if (kind == EntryKind::Directory) {
      state.whyNotRemoved = failureOf("remove", state.path, EISDIR);
      state.whyNotReplaced = failureOf("create", state.path, EISDIR);
    }
  }
  void addFile(DevicePlace place, std::string bytes) {
    addEntry(place, EntryKind::RegularFile);
    PlaceState& state = (*this)[place];
    state.identity.size = bytes.size();
    state.identity.modified = {1000, 5};
    state.permissions = 0600;
    state.contents = std::make_shared<const FakeBytes>(std::move(bytes));
    state.whyNotRead.reset();
  }
  void addPropertyList(DevicePlace place, const PropertyValue& value) {
    addFile(place, writeBinaryPropertyList(value).value());
  }
  /// A file whose medium fails while it is read.
  void addFailingFile(DevicePlace place) {
    addFile(place, "half of it");
    PlaceState& state = (*this)[place];
    state.contents =
        std::make_shared<const FakeBytes>("half of it", failureOf("read", state.path, EIO));
  }
};

}  // namespace accounts
