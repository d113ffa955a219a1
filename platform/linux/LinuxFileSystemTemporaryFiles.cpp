#include <fcntl.h>
#include <sys/file.h>

#include <cerrno>
#include <string>
#include <utility>

#include "platform/linux/LinuxFileSystem.h"
#include "platform/linux/StagedName.h"
#include "platform/linux/TemporaryFile.h"
#include "vocabulary/DevicePath.h"

namespace accounts {
namespace {

constexpr mode_t kOwnerOnlyDirectory = 0700;

}  // namespace

std::optional<std::string> LinuxFileSystem::makeTemporaryFile() {
  auto temporary = makeTemporaryFileIn(root_, temporaryDirectory_);
  if (!temporary && temporary.error().isMissing()) {
    const auto entry = root_.locate(temporaryDirectory_);
    const Result made = entry ? entry->createDirectory(kOwnerOnlyDirectory) : entry.error();
    if (made || made.error().number == EEXIST) {
      temporary = makeTemporaryFileIn(root_, temporaryDirectory_);
    }
  }
  if (!temporary) {
    return std::nullopt;
  }
  std::string path = temporary->entry.path();
  // Open, and so locked, until it is renamed or removed: as long as it is, it is not abandoned.
  temporaryFiles_.insert_or_assign(path, *std::move(temporary));
  return path;
}

OrFailure<DirectoryEntry> LinuxFileSystem::entryOf(std::string_view path) const {
  const auto temporary = temporaryFiles_.find(path);
  return temporary != temporaryFiles_.end() ? temporary->second.entry : root_.locate(path);
}

void LinuxFileSystem::removeAbandonedTemporaryFiles(
    const std::vector<std::string>& furtherDirectories) {
  removeAbandonedTemporaryFilesIn(temporaryDirectory_);
  for (const std::string& directory : furtherDirectories) {
    removeAbandonedTemporaryFilesIn(directory);
  }
}

void LinuxFileSystem::removeAbandonedTemporaryFilesIn(const std::string& directory) {
  for (const std::string& name : directoryEntries(directory).value_or(std::vector<std::string>())) {
    // What a commit left is dealt with by those who know what it replaced.
    if (!name.starts_with(kTemporaryFilePrefix) || StagedName::parse(name)) {
      continue;
    }
    const auto entry = root_.locate(joinedPath(directory, name));
    const auto file = entry ? entry->openRegularFile(O_RDONLY) : entry.error();
    // The lock is held over the removal: a maker that has made its file but not locked it yet waits
    // for it, and then sees that its file is gone.
    if (file && ::flock(file->number(), LOCK_EX | LOCK_NB) == 0) {
      (void)entry->remove();
    }
  }
}

}  // namespace accounts
