#pragma once

#include <optional>
#include <string>
#include <string_view>
#include <vector>

#include "commandline/ExitStatus.h"
#include "platform/FileSystem.h"
#include "safetynet/AccountFiles.h"

namespace accounts {

/// What putting kept files back came to.
struct Restoration {
  /// The folder whose files were asked for; none when it is not known which.
  std::optional<std::string> folder;
  /// The paths of the files that it held and that are back, in the order in which they were put
  /// back.
  std::vector<std::string> restored;
  /// The folder in which the files that they replaced are kept; none when they replaced none.
  std::optional<std::string> replaced;
  std::optional<ProgramError> error;
};

/// Puts the files of a folder of kept files back and removes the folder. Files that it does not
/// hold are left alone; what is replaced is itself kept first. `folder` is a folder's name or
/// device path; none for the only one that was kept for a migration. `time` is sortable text. It
/// can be killed at any moment and run again: the folder stays whole until everything is back. The
/// caller holds the host's lock and that of the migration.
Restoration restoreKeptFiles(FileSystem& files, const AccountFiles& accountFiles,
                             const std::optional<std::string>& folder, std::string_view time);

}  // namespace accounts
