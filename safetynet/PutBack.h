#pragma once

#include <string>
#include <string_view>

#include "platform/FileSystem.h"
#include "platform/Result.h"
#include "safetynet/AccountFiles.h"

namespace accounts {

/// Where a folder of kept files has the one that stood at a path.
std::string keptPath(std::string_view folder, std::string_view path);

/// Puts a kept file back to a path in one step, durably, whatever file is there being replaced. The
/// kept file stays. Nothing is done where the file at the path has the same contents. After a
/// failure the path is as it was, or has the kept file although that may not outlive a power cut.
Result putBack(FileSystem& files, std::string_view folder, const std::string& path);

/// Removes a file, durably; success too when it is not there.
Result removeDurably(FileSystem& files, const std::string& path);

/// Removes what a killed run that put files back left beside them.
void removePutBackLeftovers(FileSystem& files, const AccountFiles& accountFiles);

}  // namespace accounts
