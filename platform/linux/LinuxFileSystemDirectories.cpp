#include <dirent.h>
#include <fcntl.h>
#include <sys/stat.h>
#include <unistd.h>

#include <algorithm>
#include <cerrno>
#include <memory>

#include "platform/linux/FileContents.h"
#include "platform/linux/LinuxFileSystem.h"
#include "platform/linux/PathResult.h"
#include "platform/linux/PlaceFailures.h"

namespace accounts {
namespace {

struct CloseDirectory {
  void operator()(DIR* directory) const { ::closedir(directory); }
};

}  // namespace

std::optional<EntryKind> LinuxFileSystem::kindOfEntry(std::string_view path) {
  PathError error;
  const auto entry = root_.locate(path, error);
  struct stat status = {};
  if (entry && ::fstatat(entry->directory(), entry->name(), &status, AT_SYMLINK_NOFOLLOW) == 0) {
    return kindOfMode(status.st_mode);
  }
  const bool isMissing = entry ? errno == ENOENT : error.isMissing();
  return isMissing ? std::optional(EntryKind::Nothing) : std::nullopt;
}

std::optional<std::vector<std::string>> LinuxFileSystem::directoryEntries(std::string_view path) {
  PathError error;
  auto file = root_.open(path, O_RDONLY | O_DIRECTORY, error);
  if (!file) {
    return std::nullopt;
  }
  const std::unique_ptr<DIR, CloseDirectory> directory(::fdopendir(file->number()));
  if (!directory) {
    return std::nullopt;
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
    return std::nullopt;
  }
  std::ranges::sort(names);
  return names;
}

std::optional<std::string> LinuxFileSystem::shortContents(std::string_view path, std::size_t most) {
  PathError error;
  const auto file = root_.openRegularFile(path, error);
  const auto status = file ? fileStatus(*file, path, error) : std::nullopt;
  return status && static_cast<std::size_t>(status->st_size) <= most
             ? readContents(*file, path, error)
             : std::nullopt;
}

Result LinuxFileSystem::removeDirectory(std::string_view path) {
  PathError error;
  const auto entry = root_.locate(path, error);
  if (!entry) {
    return asResult(error);
  }
  const bool removed = ::unlinkat(entry->directory(), entry->name(), AT_REMOVEDIR) == 0;
  return asResult("remove the directory", path, removed ? 0 : errno);
}

Result LinuxFileSystem::synchronizeDirectory(std::string_view path) {
  PathError error;
  const auto directory = root_.open(path, O_RDONLY | O_DIRECTORY, error);
  return directory ? asResult("flush the directory", path, flushDirectory(*directory))
                   : asResult(error);
}

}  // namespace accounts
