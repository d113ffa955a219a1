#pragma once

#include <cstdint>
#include <optional>
#include <string>
#include <string_view>
#include <vector>

#include "commandline/ExitStatus.h"
#include "platform/DeviceSnapshot.h"

namespace accounts {

/// A change of one place, as it is handed from the process that knows what files hold to the one
/// that may change them.
struct ProposedChange {
  enum class Action : std::uint8_t {
    /// New contents, which stand in the memory file.
    Write,
    /// What the settings file held in the snapshot.
    CopySettings,
    Remove,
    /// An empty directory.
    MakeDirectory
  };
  DevicePlace place = DevicePlace::Settings;
  Action action = Action::Remove;
  /// Of new contents, in the memory file.
  std::uint64_t offset = 0;
  std::uint64_t length = 0;
  std::optional<FileOwner> owner = {};

  bool operator==(const ProposedChange&) const = default;
};

/// What a migration in memory came to, for the process that commits it: a flat list that it reads
/// without looking into any file.
struct Proposal {
  /// What the run ends with if all goes well. Only with success, or when not everything was carried
  /// over, is anything changed.
  ExitStatus status = ExitStatus::Success;
  /// Whether the files are to be kept as they were.
  bool keepsFiles = false;
  /// Whether the commit record stays, since a store that was carried over cannot be removed.
  bool recordStays = false;
  /// At most one for each place.
  std::vector<ProposedChange> changes;
  /// The name of the migration-information file, if there is one.
  std::string informationFileName;

  bool operator==(const Proposal&) const = default;

  /// Whether anything is to be changed.
  [[nodiscard]] bool isToBeCommitted() const {
    return status == ExitStatus::Success || status == ExitStatus::NotAllCarriedOver;
  }
  /// The change of a place; null for none.
  [[nodiscard]] const ProposedChange* changeOf(DevicePlace place) const;
};

/// A proposal as bytes, ending with a mark.
std::string bytesOf(const Proposal& proposal);

/// The proposal that bytes stand for. None unless they are whole and say nothing but what a
/// migration may do: each place at most once and changed in a way that it can be, contents within
/// the memory file's size, a name that migration-information files have.
std::optional<Proposal> proposalFrom(std::string_view bytes, std::uint64_t memoryFileSize);

}  // namespace accounts
