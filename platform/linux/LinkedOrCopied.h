#pragma once

#include "platform/linux/DirectoryEntry.h"
#include "platform/linux/PathFailure.h"

namespace accounts {

/// Gives what has a name, symbolic links not followed, a second name where nothing is. Where it can
/// have none, for whatever reason, a regular file is copied with its contents, owner, permissions
/// and time; a copy stays the user's own when that user may give no file away. The contents are on
/// the medium afterwards, but for a file that may not be read: whoever wrote it had to see to that.
/// A failure, and nothing made, when neither can be done.
Result linkOrCopy(const DirectoryEntry& source, const DirectoryEntry& destination);

}  // namespace accounts
