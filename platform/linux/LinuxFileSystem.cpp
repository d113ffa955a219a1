#include "platform/linux/LinuxFileSystem.h"

#include <fcntl.h>
#include <sys/stat.h>
#include <unistd.h>

#include <cerrno>
#include <cstdio>
#include <utility>

#include "platform/linux/FileContents.h"
#include "platform/linux/PathFailure.h"
#include "vocabulary/DevicePath.h"

namespace accounts {
namespace {

// Moves an entry, whose contents are flushed already, over another and waits until that is on the
// medium. The directory is opened before the move so that little can fail after it.
Result moveOver(const DirectoryEntry& source, const DirectoryEntry& destination) {
  Failure error;
  const auto directory = destination.openDirectory(error);
  if (!directory) {
    return error;
  }
  if (::renameat(source.directory(), source.name(), destination.directory(), destination.name()) !=
      0) {
    return asResult("rename " + source.path() + " to", destination.path(), errno);
  }
  return asResult("flush the directory of", destination.path(), flushDirectory(*directory));
}

}  // namespace

LinuxFileSystem::LinuxFileSystem(const DeviceRoot& root, std::string temporaryDirectory)
    : root_(root), ownerNames_(root), temporaryDirectory_(std::move(temporaryDirectory)) {}

bool LinuxFileSystem::fileExists(std::string_view path) {
  Failure error;
  return root_.open(path, O_PATH, error).has_value();
}

bool LinuxFileSystem::isDirectory(std::string_view path) {
  Failure error;
  return root_.open(path, O_PATH | O_DIRECTORY, error).has_value();
}

Result LinuxFileSystem::copyFile(std::string_view source, std::string_view destination) {
  Failure error;
  const auto original = root_.openRegularFile(source, error);
  const auto status = original ? fileStatus(*original, source, error) : std::nullopt;
  const auto entry = status ? root_.locate(destination, error) : std::nullopt;
  const auto copy = entry ? entry->createFile(kOwnerOnlyFile, error) : std::nullopt;
  if (!copy) {
    return error;
  }
  if (!copyContents(*original, source, *copy, destination, error)) {
    (void)entry->remove();
    return error;
  }
  if (::fchmod(copy->number(), status->st_mode & kPermissionBits) != 0) {
    const int number = errno;
    (void)entry->remove();
    return asResult("set the permissions of", destination, number);
  }
  return {};
}

Result LinuxFileSystem::removeFile(std::string_view path) {
  Failure error;
  const auto entry = entryOf(path, error);
  const Result result = entry ? asResult("remove", path, entry->remove()) : error;
  temporaryFiles_.erase(std::string(path));
  return result;
}

Result LinuxFileSystem::createFile(std::string_view path, std::string_view contents) {
  return replaceFile(path, contents);
}

Result LinuxFileSystem::createDirectoryWithIntermediates(std::string_view path,
                                                         unsigned permissions) {
  const std::string_view whole = withoutTrailingSeparators(path);
  Failure error;
  for (std::size_t end = whole.find('/', 1); end != std::string_view::npos;
       end = whole.find('/', end + 1)) {
    const std::string_view parent = whole.substr(0, end);
    if (isDirectory(parent)) {
      continue;
    }
    const auto entry = root_.locate(parent, error);
    if (!entry) {
      return error;
    }
    if (::mkdirat(entry->directory(), entry->name(), kPermissionBits) != 0) {
      const int number = errno;
      // Another process may have made it meanwhile.
      if (!isDirectory(parent)) {
        return asResult("create the directory", parent, number);
      }
    }
  }
  const auto entry = root_.locate(whole, error);
  return entry && entry->createDirectory(permissions & kPermissionBits, error) ? Result() : error;
}

Result LinuxFileSystem::writeFile(std::string_view path, const SerializedPropertyList& contents) {
  Failure error;
  const auto entry = entryOf(path, error);
  if (!entry) {
    return error;
  }
  auto file = entry->openRegularFile(O_WRONLY, error);
  if (!file && error.number == ENOENT) {
    file = entry->createFile(kOwnerOnlyFile, error);
  }
  if (!file) {
    return error;
  }
  if (::ftruncate(file->number(), 0) != 0) {
    return asResult("empty", path, errno);
  }
  return asResult("write", path, writeAll(file->number(), contents));
}

Result LinuxFileSystem::writeFileAtomically(std::string_view path,
                                            const SerializedPropertyList& contents) {
  return replaceFile(path, contents);
}

template <class Contents>
Result LinuxFileSystem::replaceFile(std::string_view path, const Contents& contents) {
  Failure error;
  const auto destination = root_.locate(path, error);
  // In the target's own directory, so that both are on one file system.
  const auto temporary =
      destination ? makeTemporaryFileIn(root_, splitPath(path).directory, error) : std::nullopt;
  if (!temporary) {
    return error;
  }
  int number = writeAll(temporary->file.number(), contents);
  if (number == 0) {
    number = flush(temporary->file);
  }
  Result result = asResult("write", path, number);
  if (result) {
    result = moveOver(temporary->entry, *destination);
  }
  if (!result) {
    // Gone already when only the directory could not be flushed; then there is nothing to remove.
    (void)temporary->entry.remove();
  }
  return result;
}

Result LinuxFileSystem::setOwnerAndGroup(std::string_view path, std::string_view ownerName,
                                         std::string_view groupName) {
  Failure error;
  const auto user = ownerNames_.userIdentifier(std::string(ownerName), error);
  const auto group =
      user ? ownerNames_.groupIdentifier(std::string(groupName), error) : std::nullopt;
  const auto entry = group ? entryOf(path, error) : nullptr;
  const auto file = entry ? entry->openRegularFile(O_RDONLY, error) : std::nullopt;
  if (!file) {
    return error;
  }
  if (::fchown(file->number(), *user, *group) != 0) {
    return asResult("set the owner of", path, errno);
  }
  return {};
}

Result LinuxFileSystem::renameFile(std::string_view source, std::string_view destination) {
  Failure error;
  const auto from = entryOf(source, error);
  const auto to = from ? root_.locate(destination, error) : std::nullopt;
  const auto file = to ? from->openRegularFile(O_RDONLY, error) : std::nullopt;
  if (!file) {
    return error;
  }
  const int number = flush(*file);
  const Result result = number == 0 ? moveOver(*from, *to) : asResult("flush", source, number);
  if (result) {
    temporaryFiles_.erase(std::string(source));
  }
  return result;
}

Result LinuxFileSystem::renameDirectory(std::string_view source, std::string_view destination) {
  Failure error;
  const auto from = root_.locate(source, error);
  const auto to = from ? root_.locate(destination, error) : std::nullopt;
  if (!to) {
    return error;
  }
  struct stat status = {};
  if (::fstatat(from->directory(), from->name(), &status, AT_SYMLINK_NOFOLLOW) != 0) {
    return asResult("rename", source, errno);
  }
  if (!S_ISDIR(status.st_mode)) {
    return asResult("rename", source, ENOTDIR);
  }
  return moveOver(*from, *to);
}

}  // namespace accounts
