#include <fcntl.h>
#include <sys/stat.h>
#include <unistd.h>

#include <cerrno>
#include <cstdio>
#include <utility>

#include "platform/linux/FileContents.h"
#include "platform/linux/LinkedOrCopied.h"
#include "platform/linux/LinuxDevicePlaces.h"
#include "platform/linux/PlaceFailures.h"
#include "platform/linux/RenameToNothing.h"
#include "platform/linux/StagedName.h"
#include "platform/linux/TemporaryFile.h"
#include "vocabulary/DevicePath.h"

namespace accounts {
namespace {

// Each turn of the loop below means that another program wrote in between.
constexpr int kMostExchanges = 1000;

/// The same for a random name that nobody else has, so that nothing is replaced in any case.
int renameAside(int directory, const char* from, const char* aside) {
  if (::renameat2(directory, from, directory, aside, RENAME_NOREPLACE) == 0 ||
      (cannotExchange(errno) && ::renameat(directory, from, directory, aside) == 0)) {
    return 0;
  }
  return errno;
}

/// What stands under a name; none where that cannot be told.
std::optional<FileIdentity> entryIn(int directory, const char* name) {
  struct stat status = {};
  if (::fstatat(directory, name, &status, AT_SYMLINK_NOFOLLOW) == 0) {
    return identityOf(status);
  }
  return errno == ENOENT ? std::optional(FileIdentity()) : std::nullopt;
}

/// The same; nothing also where that cannot be told.
FileIdentity identityIn(int directory, const char* name) {
  return entryIn(directory, name).value_or(FileIdentity());
}

bool isInode(const FileIdentity& identity, const struct stat& file) {
  return identity.exists() && identity.device == file.st_dev && identity.inode == file.st_ino;
}

/// A file that has a name of its own beside its place.
class StagedEntry final : public StagedFile {
 public:
  StagedEntry(DirectoryEntry stagedEntry, FileDescriptor opened)
      : entry(std::move(stagedEntry)), file(std::move(opened)) {}
  StagedEntry(const StagedEntry&) = delete;
  StagedEntry& operator=(const StagedEntry&) = delete;
  ~StagedEntry() override {
    if (isThere) {
      (void)entry.remove();
    }
  }

  /// Takes a name that says what is to be replaced. Returns 0 or the error number.
  int rename(DevicePlace place, std::uint64_t replaced) {
    const auto name = StagedName{place, status.st_ino, replaced}.text();
    if (!name) {
      return errno;
    }
    const int number = renameAside(entry.directory(), entry.name(), name->c_str());
    if (number == 0) {
      entry = entry.withName(*name);
    }
    return number;
  }

  DirectoryEntry entry;
  /// Open, and so locked as a temporary file is.
  FileDescriptor file;
  struct stat status = {};
  bool isThere = true;
};

/// Exchanges what two names of a directory have until what comes out under `own` is what was put
/// in place of it before: `lastPut` was, and `inHand`, which another program wrote, came out. What
/// is newest stands under `name` afterwards, and `own` is free. Whoever writes again and again
/// without end keeps its file under `own`.
void handBack(int directory, const char* own, const char* name, FileIdentity lastPut,
              FileIdentity inHand) {
  for (int turn = 0; turn < kMostExchanges; ++turn) {
    if (::renameat2(directory, own, directory, name, RENAME_EXCHANGE) != 0) {
      // Gone meanwhile: then nothing is in the way.
      (void)renameToNothing(directory, own, name);
      return;
    }
    const std::optional<FileIdentity> out = entryIn(directory, own);
    if (!out) {
      // The next run tells by the number whose it is.
      return;
    }
    // Our own, too, once another program has written into it.
    if (out->isSameFileAs(lastPut)) {
      (void)::unlinkat(directory, own, 0);
      return;
    }
    lastPut = inHand;
    inHand = *out;
  }
}

}  // namespace

std::variant<std::unique_ptr<StagedFile>, PlaceFailure> LinuxDevicePlaces::stage(
    DevicePlace place, const NewFile& file) {
  PathError error;
  const std::string path = pathOf(place);
  const Directory* const directory = openDirectoryAt(place, error);
  auto made = directory != nullptr
                  ? makeTemporaryFileIn(directory->descriptor, splitPath(path).directory, error)
                  : std::nullopt;
  if (!made) {
    return placeFailure(error);
  }
  const int descriptor = made->file.number();
  auto staged = std::make_unique<StagedEntry>(std::move(made->entry), std::move(made->file));
  int number = 0;
  std::optional<PlaceFailure> unread = file.contents->giveTo([&](std::string_view piece) {
    number = writeAll(descriptor, piece);
    return number == 0;
  });
  if (unread) {
    return *std::move(unread);
  }
  // All by the descriptor: whatever another process puts under the name, only this file changes.
  if (number == 0 && file.owner && ::fchown(descriptor, file.owner->user, file.owner->group) != 0) {
    return placeFailure("set the owner of", path, errno);
  }
  if (number == 0 && ::fchmod(descriptor, file.permissions & kPermissionBits) != 0) {
    return placeFailure("set the permissions of", path, errno);
  }
  if (number == 0) {
    number = accounts::flush(staged->file);
  }
  if (number == 0 && ::fstat(descriptor, &staged->status) != 0) {
    number = errno;
  }
  if (number != 0) {
    return placeFailure("write", path, number);
  }
  return staged;
}

std::variant<std::unique_ptr<StagedFile>, PlaceFailure> LinuxDevicePlaces::stageKept(
    DevicePlace place, std::string_view keptPath) {
  PathError error;
  const std::string path = pathOf(place);
  const auto kept = root_.locate(keptPath, error);
  const Directory* const directory = kept ? openDirectoryAt(place, error) : nullptr;
  auto entry = directory != nullptr
                   ? freeEntryIn(directory->descriptor, splitPath(path).directory, error)
                   : std::nullopt;
  if (!entry || !linkOrCopy(*kept, *entry, error)) {
    return placeFailure(error);
  }
  auto file = entry->openForItsPath(error);
  const auto status = file ? fileStatus(*file, path, error) : std::nullopt;
  if (!status) {
    (void)entry->remove();
    return placeFailure(error);
  }
  auto staged = std::make_unique<StagedEntry>(std::move(*entry), std::move(*file));
  staged->status = *status;
  return staged;
}

PlaceOutcome LinuxDevicePlaces::put(DevicePlace place, StagedFile& file,
                                    const FileIdentity& expected) {
  auto& staged = static_cast<StagedEntry&>(file);
  const std::string path = pathOf(place);
  const std::string name(splitPath(path).name);
  if (expected.kind == EntryKind::Directory) {
    // It could be exchanged, but not be removed afterwards.
    return PlaceOutcome::failed(placeFailure("replace", path, EISDIR));
  }
  if (const int number = staged.rename(place, expected.inode); number != 0) {
    return PlaceOutcome::failed(placeFailure("rename a file to", path, number));
  }
  const int directory = staged.entry.directory();
  const char* const own = staged.entry.name();
  if (!expected.exists()) {
    const int number = renameToNothing(directory, own, name.c_str());
    if (number == EEXIST) {
      return PlaceOutcome::disturbed();
    }
    if (number != 0) {
      return PlaceOutcome::failed(placeFailure("rename a file to", path, number));
    }
    staged.isThere = false;
    const std::optional<FileIdentity> in = entryIn(directory, name.c_str());
    return !in || isInode(*in, staged.status) ? PlaceOutcome::done() : PlaceOutcome::overtaken();
  }
  if (::renameat2(directory, own, directory, name.c_str(), RENAME_EXCHANGE) != 0) {
    if (errno == ENOENT) {
      return PlaceOutcome::disturbed();
    }
    if (!cannotExchange(errno)) {
      return PlaceOutcome::failed(placeFailure("exchange a file with", path, errno));
    }
    // The window that is left: what another program puts there from here on is replaced.
    if (!isInode(identityIn(directory, own), staged.status) ||
        !identityIn(directory, name.c_str()).isSameFileAs(expected)) {
      return PlaceOutcome::disturbed();
    }
    if (::renameat(directory, own, directory, name.c_str()) != 0) {
      return PlaceOutcome::failed(placeFailure("rename a file to", path, errno));
    }
    staged.isThere = false;
    return PlaceOutcome::done();
  }
  staged.isThere = false;
  const std::optional<FileIdentity> out = entryIn(directory, own);
  if (!out) {
    // The file has its place. Whose came out, the next run tells by its number.
    return PlaceOutcome::done();
  }
  if (!out->isSameFileAs(expected)) {
    handBack(directory, own, name.c_str(), identityOf(staged.status), *out);
    return PlaceOutcome::overtaken();
  }
  const std::optional<FileIdentity> in = entryIn(directory, name.c_str());
  if (in && !isInode(*in, staged.status)) {
    // Another file took the place at once, or took the staged name just before. The first is the
    // newest and stays; the second, which shows in its further name, must not stay.
    struct stat other = {};
    const bool isForeignLink =
        ::fstatat(directory, name.c_str(), &other, AT_SYMLINK_NOFOLLOW) == 0 && other.st_nlink > 1;
    if (!isForeignLink ||
        ::renameat2(directory, own, directory, name.c_str(), RENAME_EXCHANGE) == 0) {
      (void)::unlinkat(directory, own, 0);
    }
    return PlaceOutcome::overtaken();
  }
  (void)::unlinkat(directory, own, 0);
  return PlaceOutcome::done();
}

PlaceOutcome LinuxDevicePlaces::remove(DevicePlace place, const FileIdentity& expected) {
  PathError error;
  const std::string path = pathOf(place);
  const Directory* const opened = openDirectoryAt(place, error);
  if (opened == nullptr) {
    return PlaceOutcome::failed(placeFailure(error));
  }
  const int directory = opened->descriptor->number();
  const std::string name(splitPath(path).name);
  const auto aside = StagedName{place, 0, expected.inode}.text();
  if (!aside) {
    return PlaceOutcome::failed(placeFailure("make a temporary name in", path, errno));
  }
  if (expected.kind == EntryKind::Directory) {
    return PlaceOutcome::failed(placeFailure("remove", path, EISDIR));
  }
  if (const int number = renameAside(directory, name.c_str(), aside->c_str()); number != 0) {
    return number == ENOENT ? PlaceOutcome::disturbed()
                            : PlaceOutcome::failed(placeFailure("remove", path, number));
  }
  if (!identityIn(directory, aside->c_str()).isSameFileAs(expected)) {
    // Where another one stands there by now, that is newer and this one was replaced by it.
    if (renameToNothing(directory, aside->c_str(), name.c_str()) == EEXIST) {
      (void)::unlinkat(directory, aside->c_str(), 0);
    }
    return PlaceOutcome::disturbed();
  }
  const bool isRemoved = ::unlinkat(directory, aside->c_str(), 0) == 0;
  return isRemoved ? PlaceOutcome::done()
                   : PlaceOutcome::failed(placeFailure("remove", path, errno));
}

PlaceOutcome LinuxDevicePlaces::keep(DevicePlace place, std::string_view keptPath,
                                     const FileIdentity& expected) {
  PathError error;
  const std::string path = pathOf(place);
  const auto source = root_.locate(path, error);
  const auto kept = source ? root_.locate(keptPath, error) : std::nullopt;
  if (!kept) {
    return PlaceOutcome::failed(placeFailure(error));
  }
  const bool isSame = identityIn(source->directory(), source->name()).isSameFileAs(expected);
  if (!isSame) {
    return PlaceOutcome::disturbed();
  }
  if (!linkOrCopy(*source, *kept, error)) {
    return PlaceOutcome::failed(placeFailure(error));
  }
  const FileIdentity made = identityIn(kept->directory(), kept->name());
  const bool isOther = made.inode == expected.inode
                           ? !made.isSameFileAs(expected)
                           : made.size != expected.size || made.modified != expected.modified;
  if (isOther) {
    (void)kept->remove();
    return PlaceOutcome::disturbed();
  }
  return PlaceOutcome::done();
}

std::optional<PlaceFailure> LinuxDevicePlaces::flush(DevicePlace place) {
  PathError error;
  const std::string path = pathOf(place);
  const Directory* const opened = openDirectoryAt(place, error);
  const auto directory = opened != nullptr ? DirectoryEntry(opened->descriptor,
                                                            std::string(splitPath(path).name), path)
                                                 .openDirectory(error)
                                           : std::nullopt;
  if (!directory) {
    const bool isMissing = error.number == ENOENT || error.number == ENOTDIR;
    return isMissing ? std::nullopt : std::optional(placeFailure(error));
  }
  const int number = flushDirectory(*directory);
  return number == 0 ? std::nullopt
                     : std::optional(placeFailure("flush the directory of", path, number));
}

std::optional<PlaceFailure> LinuxDevicePlaces::makeInformationDirectory() {
  const std::string directory = pathOf(DevicePlace::InformationDirectory);
  if (files_.isDirectory(directory)) {
    return std::nullopt;
  }
  constexpr unsigned kEverybody = 0777;
  const Result made = files_.createDirectoryWithIntermediates(directory, kEverybody);
  return made ? std::nullopt : std::optional(PlaceFailure{0, made.error()});
}

std::optional<PlaceFailure> LinuxDevicePlaces::writeInformationFile(std::string_view name,
                                                                    const ReadableBytes& contents) {
  if (auto failure = makeInformationDirectory()) {
    return failure;
  }
  const std::string directory = pathOf(DevicePlace::InformationDirectory);
  PathError error;
  const std::string path = joinedPath(directory, name);
  const auto entry = root_.locate(path, error);
  auto temporary = entry ? makeTemporaryFileIn(root_, directory, error) : std::nullopt;
  if (!temporary) {
    return placeFailure(error);
  }
  int number = 0;
  std::optional<PlaceFailure> failure = contents.giveTo([&](std::string_view piece) {
    number = writeAll(temporary->file.number(), piece);
    return number == 0;
  });
  if (!failure && number == 0) {
    number = accounts::flush(temporary->file);
  }
  if (!failure && number == 0 &&
      ::renameat(temporary->entry.directory(), temporary->entry.name(), entry->directory(),
                 entry->name()) != 0) {
    number = errno;
  }
  if (!failure && number != 0) {
    failure = placeFailure("write", path, number);
  }
  if (failure) {
    (void)temporary->entry.remove();
  }
  return failure;
}

}  // namespace accounts
