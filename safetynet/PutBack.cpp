#include "safetynet/PutBack.h"

namespace accounts {
namespace {

constexpr std::string_view kStagingPrefix = ".putting-back-";

// Beside the file that it becomes, so that both are on one file system.
std::string stagingPath(std::string_view path) {
  return pathIn(directoryOf(path), std::string(kStagingPrefix).append(nameOf(path)));
}

}  // namespace

std::string keptPath(std::string_view folder, std::string_view path) {
  return pathIn(folder, nameOf(path));
}

Result putBack(FileSystem& files, std::string_view folder, const std::string& path) {
  const std::string kept = keptPath(folder, path);
  if (files.haveSameContents(kept, path)) {
    // Put there, perhaps, by a run that was killed before it could flush.
    return files.synchronizeDirectory(directoryOf(path));
  }
  const std::string staging = stagingPath(path);
  Result result = files.linkFile(kept, staging);
  if (result) {
    result = files.renameFile(staging, path);
    if (!result) {
      (void)files.removeFile(staging);
    }
  }
  return result;
}

Result removeDurably(FileSystem& files, const std::string& path) {
  if (files.kindOfEntry(path) != EntryKind::Nothing) {
    if (Result removed = files.removeFile(path); !removed) {
      return removed;
    }
  } else if (!files.isDirectory(directoryOf(path))) {
    return Result::success();
  }
  // Also where it is gone already: whoever removed it need not have flushed.
  return files.synchronizeDirectory(directoryOf(path));
}

void removePutBackLeftovers(FileSystem& files, const AccountFiles& accountFiles) {
  for (const std::string& path : accountFiles.inputs()) {
    // Hardly ever there.
    (void)files.removeFile(stagingPath(path));
  }
}

}  // namespace accounts
