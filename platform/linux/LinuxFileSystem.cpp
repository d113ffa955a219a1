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
  const auto directory = destination.openDirectory();
  if (!directory) {
    return directory.error();
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
  return root_.open(path, O_PATH).has_value();
}

bool LinuxFileSystem::isDirectory(std::string_view path) {
  return root_.open(path, O_PATH | O_DIRECTORY).has_value();
}

Result LinuxFileSystem::copyFile(std::string_view source, std::string_view destination) {
  const auto original = root_.openRegularFile(source);
  const auto status = original ? fileStatus(*original, source) : original.error();
  const auto entry = status ? root_.locate(destination) : status.error();
  const auto copy = entry ? entry->createFile(kOwnerOnlyFile) : entry.error();
  if (!copy) {
    return copy.error();
  }
  if (Result copied = copyContents(*original, source, *copy, destination); !copied) {
    (void)entry->remove();
    return copied;
  }
  if (::fchmod(copy->number(), status->st_mode & kPermissionBits) != 0) {
    const int number = errno;
    (void)entry->remove();
    return asResult("set the permissions of", destination, number);
  }
  return {};
}

Result LinuxFileSystem::removeFile(std::string_view path) {
  const auto entry = entryOf(path);
  const Result result = entry ? asResult("remove", path, entry->remove()) : entry.error();
  temporaryFiles_.erase(std::string(path));
  return result;
}

Result LinuxFileSystem::createFile(std::string_view path, std::string_view contents) {
  return replaceFile(path, contents);
}

Result LinuxFileSystem::createDirectoryWithIntermediates(std::string_view path,
                                                         unsigned permissions) {
  const std::string_view whole = withoutTrailingSeparators(path);
  for (std::size_t end = whole.find('/', 1); end != std::string_view::npos;
       end = whole.find('/', end + 1)) {
    const std::string_view parent = whole.substr(0, end);
    if (isDirectory(parent)) {
      continue;
    }
    const auto entry = root_.locate(parent);
    if (!entry) {
      return entry.error();
    }
    if (::mkdirat(entry->directory(), entry->name(), kPermissionBits) != 0) {
      const int number = errno;
      // Another process may have made it meanwhile.
      if (!isDirectory(parent)) {
        return asResult("create the directory", parent, number);
      }
    }
  }
  const auto entry = root_.locate(whole);
  return entry ? entry->createDirectory(permissions & kPermissionBits) : entry.error();
}

Result LinuxFileSystem::writeFile(std::string_view path, const SerializedPropertyList& contents) {
  const auto entry = entryOf(path);
  auto file = entry ? entry->openRegularFile(O_WRONLY) : entry.error();
  if (entry && !file && file.error().number == ENOENT) {
    file = entry->createFile(kOwnerOnlyFile);
  }
  if (!file) {
    return file.error();
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
  const auto destination = root_.locate(path);
  // In the target's own directory, so that both are on one file system.
  const auto temporary =
      destination ? makeTemporaryFileIn(root_, splitPath(path).directory) : destination.error();
  if (!temporary) {
    return temporary.error();
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
  const auto user = ownerNames_.userIdentifier(std::string(ownerName));
  const auto group = user ? ownerNames_.groupIdentifier(std::string(groupName)) : user.error();
  const auto entry = group ? entryOf(path) : group.error();
  const auto file = entry ? entry->openRegularFile(O_RDONLY) : entry.error();
  if (!file) {
    return file.error();
  }
  if (::fchown(file->number(), *user, *group) != 0) {
    return asResult("set the owner of", path, errno);
  }
  return {};
}

Result LinuxFileSystem::renameFile(std::string_view source, std::string_view destination) {
  const auto from = entryOf(source);
  const auto to = from ? root_.locate(destination) : from.error();
  const auto file = to ? from->openRegularFile(O_RDONLY) : to.error();
  if (!file) {
    return file.error();
  }
  const int number = flush(*file);
  const Result result = number == 0 ? moveOver(*from, *to) : asResult("flush", source, number);
  if (result) {
    temporaryFiles_.erase(std::string(source));
  }
  return result;
}

Result LinuxFileSystem::renameDirectory(std::string_view source, std::string_view destination) {
  const auto from = root_.locate(source);
  const auto to = from ? root_.locate(destination) : from.error();
  if (!to) {
    return to.error();
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
