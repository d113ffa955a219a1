#include <dirent.h>
#include <fcntl.h>
#include <sys/stat.h>
#include <unistd.h>

#include <algorithm>
#include <cerrno>
#include <memory>

#include "platform/linux/EntryIdentity.h"
#include "platform/linux/FileContents.h"
#include "platform/linux/LinuxFileSystem.h"
#include "platform/linux/PathFailure.h"

namespace accounts {
namespace {

struct CloseDirectory {
  void operator()(DIR* directory) const { ::closedir(directory); }
};

}  // namespace

OrFailure<EntryKind> LinuxFileSystem::kindOfEntry(std::string_view path) {
  const auto entry = root_.locate(path);
  struct stat status = {};
  if (entry && ::fstatat(entry->directory(), entry->name(), &status, AT_SYMLINK_NOFOLLOW) == 0) {
    return kindOfMode(status.st_mode);
  }
  Failure failure = entry ? pathFailure("look at", path, errno) : entry.error();
  if (failure.isMissing()) {
    return EntryKind::Nothing;
  }
  return failure;
}

OrFailure<std::vector<std::string>> LinuxFileSystem::directoryEntries(std::string_view path) {
  auto file = root_.open(path, O_RDONLY | O_DIRECTORY);
  if (!file) {
    return file.error();
  }
  const std::unique_ptr<DIR, CloseDirectory> directory(::fdopendir(file->number()));
  if (!directory) {
    return pathFailure("read the directory", path, errno);
  }
  // The stream closes it.
  (void)file->release();
  std::vector<std::string> names;
  for (;;) {
    errno = 0;
    const dirent* const entry = ::readdir(directory.get());
    if (entry == nullptr) {
      break;
    }
    const std::string_view name = entry->d_name;
    if (name != "." && name != "..") {
      names.emplace_back(name);
    }
  }
  if (errno != 0) {
    return pathFailure("read the directory", path, errno);
  }
  std::ranges::sort(names);
  return names;
}

OrFailure<std::string> LinuxFileSystem::shortContents(std::string_view path, std::size_t most) {
  const auto file = root_.openRegularFile(path);
  const auto status = file ? fileStatus(*file, path) : file.error();
  if (!status) {
    return status.error();
  }
  if (static_cast<std::size_t>(status->st_size) > most) {
    return pathFailure("read", path, EFBIG);
  }
  return readContents(*file, path);
}

Result LinuxFileSystem::removeDirectory(std::string_view path) {
  const auto entry = root_.locate(path);
  if (!entry) {
    return entry.error();
  }
  const bool removed = ::unlinkat(entry->directory(), entry->name(), AT_REMOVEDIR) == 0;
  return asResult("remove the directory", path, removed ? 0 : errno);
}

Result LinuxFileSystem::synchronizeDirectory(std::string_view path) {
  const auto directory = root_.open(path, O_RDONLY | O_DIRECTORY);
  return directory ? asResult("flush the directory", path, flushDirectory(*directory))
                   : directory.error();
}

}  // namespace accounts
