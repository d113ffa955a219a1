#pragma once

#include <functional>
#include <memory>
#include <optional>
#include <string>
#include <string_view>
#include <vector>

#include "commandline/ExitStatus.h"
#include "platform/DevicePlaces.h"
#include "safetynet/KeptFolders.h"
#include "safetynet/Proposal.h"

namespace accounts {

/// What a commit came to.
struct CommitOutcome {
  enum class Kind : std::uint8_t {
    Done,
    /// Another program wrote meanwhile: nothing is changed, and the migration is to be made anew.
    Disturbed,
    /// Nothing is changed.
    Failed
  };
  Kind kind = Kind::Done;
  ProgramError error = {};
  /// What could not be done beside what is essential, one sentence each.
  std::vector<std::string> warnings = {};
  /// The folder in which the files are kept as they were.
  std::optional<std::string> keptFolder = {};
};

/// Gives the contents of a change of a proposal, wherever they stand.
using ContentsOf = std::function<std::unique_ptr<ReadableBytes>(const ProposedChange& change)>;

/// Makes on the device what a migration in memory proposes. Until the settings file has its place,
/// everything that fails leaves the device as it was; from then on everything that fails is a
/// warning. It looks into no file.
///
/// In this order: what is to be kept, the commit record, the settings file, the sentinel, the
/// legacy stores, the end of the sentinel, the files for engineers and the mail application, the
/// end of the record.
class Commit {
 public:
  /// All must outlive this. `time` is sortable text for a folder of kept files.
  Commit(DevicePlaces& places, KeptFolders& folders, const DeviceSnapshot& snapshot,
         const Proposal& proposal, ContentsOf contentsOf, std::string time);

  CommitOutcome run();

 private:
  [[nodiscard]] const FileIdentity& identity(DevicePlace place) const {
    return snapshot_.at(place).identity;
  }
  [[nodiscard]] bool removes(DevicePlace place) const;
  /// What keeps the essential part from being done; none when the settings file has its place.
  std::optional<CommitOutcome> replaceSettings();
  /// Whether everything still stands as the snapshot found it; a failure when that cannot be told.
  std::optional<CommitOutcome> whyNotUndisturbed();
  std::optional<CommitOutcome> keepFiles();
  std::optional<CommitOutcome> writeRecord();
  /// Puts a new file in the place of what the snapshot found there; `written` is that file then.
  PlaceOutcome write(DevicePlace place, const NewFile& file, FileIdentity& written);
  void undo();
  void removeStores();
  /// Removes what stood at a place; false, with a warning, when that cannot be done.
  bool removeOrWarn(DevicePlace place);
  void makeCopyAside();
  void writeInformation();
  void endRecord();
  void warn(std::string sentence) { outcome_.warnings.push_back(std::move(sentence)); }
  /// Warns of something with which the next run needs the record.
  void keepRecord(std::string sentence);
  /// Whether the names in a place's directory are on the medium.
  bool flushOrWarn(DevicePlace place);

  DevicePlaces& places_;
  KeptFolders& folders_;
  const DeviceSnapshot& snapshot_;
  const Proposal& proposal_;
  ContentsOf contentsOf_;
  std::string time_;

  CommitOutcome outcome_;
  /// The record that this run wrote; nothing for none.
  FileIdentity record_;
  /// Whether nothing is left for which the next run needs the record.
  bool recordMayEnd_ = true;
};

}  // namespace accounts
