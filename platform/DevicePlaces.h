#pragma once

#include <memory>
#include <optional>
#include <string>
#include <string_view>
#include <vector>

#include "platform/DeviceSnapshot.h"
#include "platform/Result.h"

namespace accounts {

/// How an attempt to change what stands at a place ended.
struct PlaceOutcome {
  enum class Kind : std::uint8_t {
    Done,
    /// Somebody else's file was met there; it stands where it stood.
    Disturbed,
    Failed
  };
  Kind kind = Kind::Done;
  /// Of a failure.
  Failure failure = {};
  /// Of somebody else's file that was met: whether the new file stood at the place for a moment, so
  /// that what stands there now may come from it.
  bool hasStood = false;

  static PlaceOutcome done() { return {}; }
  static PlaceOutcome disturbed() { return {.kind = Kind::Disturbed}; }
  static PlaceOutcome overtaken() { return {.kind = Kind::Disturbed, .hasStood = true}; }
  static PlaceOutcome failed(Failure failure) {
    return {.kind = Kind::Failed, .failure = std::move(failure)};
  }
  [[nodiscard]] bool isDone() const { return kind == Kind::Done; }
};

/// A new file beside a place, complete and on the medium, that is to get the place. Removed when
/// this goes without having got it.
class StagedFile {
 public:
  virtual ~StagedFile() = default;

  /// What it is, whatever name it has.
  FileIdentity identity;
};

/// What a new file is made of.
struct NewFile {
  const ReadableBytes* contents = nullptr;
  unsigned permissions = 0600;
  /// None leaves it to whoever makes it.
  std::optional<FileOwner> owner = {};
};

/// The places of a device, for the one process that may change them. It opens their directories
/// when it takes a snapshot and acts in these alone afterwards, whatever their paths lead to then.
/// Nothing here looks into a file.
class DevicePlaces {
 public:
  virtual ~DevicePlaces() = default;

  /// What stands at all places now. A failure when that cannot be told, when a file that a
  /// migration reads cannot be opened for another reason than that none is there, or when two
  /// places are one.
  virtual OrFailure<DeviceSnapshot> takeSnapshot() = 0;

  /// What stands at a place now; a failure when that cannot be told.
  virtual OrFailure<FileIdentity> identityAt(DevicePlace place) = 0;

  /// Makes a new file beside a place.
  virtual OrFailure<std::unique_ptr<StagedFile>> stage(DevicePlace place, const NewFile& file) = 0;
  /// The same with a second name of the kept file at a device path; with a copy that has its
  /// contents, owner, permissions and time, where the file can have no second name.
  virtual OrFailure<std::unique_ptr<StagedFile>> stageKept(DevicePlace place,
                                                           std::string_view keptPath) = 0;

  /// Gives a staged file its place, in one step, if what stands there is `expected` but for the
  /// time of its change. What it replaces is gone afterwards. Where the file system cannot exchange
  /// two files, what another program puts there between the last look and the step is lost.
  virtual PlaceOutcome put(DevicePlace place, StagedFile& staged, const FileIdentity& expected) = 0;

  /// Removes the file at a place, if it is `expected` but for the time of its change.
  virtual PlaceOutcome remove(DevicePlace place, const FileIdentity& expected) = 0;

  /// Gives what stands at a place, if that is `expected` but for the time of its change, a second
  /// name at a device path where nothing is, or makes a copy there as `stageKept` does. Its
  /// contents are on the medium afterwards.
  virtual PlaceOutcome keep(DevicePlace place, std::string_view keptPath,
                            const FileIdentity& expected) = 0;

  /// Waits until the names in a place's directory are on the medium; there are none where it has no
  /// directory.
  virtual Result flush(DevicePlace place) = 0;

  /// Makes the directory of the migration-information files, with its missing parents, if nothing
  /// is there.
  virtual Result makeInformationDirectory() = 0;
  /// Does the same, and makes a file in it. `name` is one component.
  virtual Result writeInformationFile(std::string_view name, const ReadableBytes& contents) = 0;

  /// Deals with what killed runs left beside the places: their own files go, what they had moved
  /// away of others comes back. A sentence for each file that could not be dealt with.
  virtual std::vector<std::string> settleLeftovers() = 0;
};

}  // namespace accounts
