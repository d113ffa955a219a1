#pragma once

#include <optional>
#include <string>
#include <string_view>
#include <vector>

#include "commandline/ExitStatus.h"
#include "platform/DevicePlaces.h"
#include "safetynet/KeptFolders.h"

namespace accounts {

/// What putting kept files back came to.
struct Restoration {
  /// The folder whose files were asked for; none when it is not known which.
  std::optional<std::string> folder;
  /// The paths of the files that are back, in the order in which they were put back.
  std::vector<std::string> restored;
  /// The paths at which nothing stands again, as before.
  std::vector<std::string> removed;
  /// The folder in which what was replaced is kept; none when nothing was.
  std::optional<std::string> replaced;
  std::optional<ProgramError> error;
};

/// The folder that a name or a device path means, or the only one that was kept for a migration
/// where none is given.
OrProgramError<std::string> chosenFolder(const KeptFolders& folders,
                                         const std::optional<std::string>& asked);

/// Brings the places of a device back to what a folder of kept files says stood there, and removes
/// the folder. What is replaced or removed is itself kept first. A commit record and a removal
/// sentinel end before anything else: with either the next migration would take the stores that
/// come back for converted ones. It can be killed at any moment and run again: the folder stays
/// whole until everything is back. `home` is the home directory, `time` sortable text. The caller
/// holds the host's lock and that of the migration.
Restoration restoreKeptFiles(DevicePlaces& places, KeptFolders& folders, std::string_view home,
                             const std::optional<std::string>& folder, std::string_view time);

}  // namespace accounts
