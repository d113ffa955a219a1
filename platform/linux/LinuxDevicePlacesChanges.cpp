#include <fcntl.h>
#include <sys/stat.h>
#include <unistd.h>

#include <cerrno>
#include <cstdio>
#include <utility>

#include "platform/linux/EntryIdentity.h"
#include "platform/linux/FileContents.h"
#include "platform/linux/LinkedOrCopied.h"
#include "platform/linux/LinuxDevicePlaces.h"
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

/// What stands under a name; nothing also where that cannot be told.
FileIdentity identityIn(int directory, const char* name) {
  return entryIn(directory, name).value_or(FileIdentity());
}

/// Gives what an entry is the name that says what is to become of it, and the entry that name.
/// Returns 0 or the error number.
int renameTo(const StagedName& staged, DirectoryEntry& entry) {
  const auto name = staged.text();
  const int number = name ? renameAside(entry.directory(), entry.name(), name->c_str()) : errno;
  if (number == 0) {
    entry = entry.withName(*name);
  }
  return number;
}

bool isSameInode(const FileIdentity& one, const FileIdentity& other) {
  return one.exists() && one.device == other.device && one.inode == other.inode;
}

/// Writes all into a new file.
Result writeContents(const ReadableBytes& contents, const FileDescriptor& file,
                     std::string_view path) {
  int number = 0;
  Result given = contents.giveTo([&](std::string_view piece) {
    number = writeAll(file.number(), piece);
    return number == 0;
  });
  return number == 0 ? std::move(given) : pathFailure("write", path, number);
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

  DirectoryEntry entry;
  /// Open, and so locked as a temporary file is.
  FileDescriptor file;
  bool isThere = true;
};

/// Exchanges what the name of a place and `own` beside it have until what comes out is what was put
/// in the place before: `lastPut` was, and `inHand`, which another program wrote, came out. What
/// is newest stands at the place afterwards, and `own` is free. While another program writes again
/// and again without end, a file stays under `own`, which the next run deals with.
void handBack(DevicePlace place, DirectoryEntry& own, const char* name, FileIdentity lastPut,
              FileIdentity inHand) {
  const int directory = own.directory();
  for (int turn = 0; turn < kMostExchanges; ++turn) {
    // Under its old name it is only harder to tell what to do with it when this process is killed.
    (void)renameTo({place, markOf(lastPut), 0, markOf(inHand)}, own);
    if (::renameat2(directory, own.name(), directory, name, RENAME_EXCHANGE) != 0) {
      // Gone meanwhile: then nothing is in the way.
      (void)renameToNothing(directory, own.name(), name);
      return;
    }
    const std::optional<FileIdentity> out = entryIn(directory, own.name());
    if (!out) {
      // The next run tells by the mark whose it is.
      return;
    }
    // Our own, too, once another program has written into it.
    if (out->isSameFileAs(lastPut)) {
      (void)own.remove();
      return;
    }
    lastPut = inHand;
    inHand = *out;
  }
}

}  // namespace

OrFailure<std::unique_ptr<StagedFile>> LinuxDevicePlaces::stage(DevicePlace place,
                                                                const NewFile& file) {
  const std::string path = pathOf(place);
  const auto directory = openDirectoryAt(place);
  auto made = directory ? makeTemporaryFileIn((*directory)->descriptor, splitPath(path).directory)
                        : directory.error();
  if (!made) {
    return made.error();
  }
  const int descriptor = made->file.number();
  auto staged = std::make_unique<StagedEntry>(std::move(made->entry), std::move(made->file));
  if (const Result written = writeContents(*file.contents, staged->file, path); !written) {
    return written.error();
  }
  // All by the descriptor: whatever another process puts under the name, only this file changes.
  if (file.owner && ::fchown(descriptor, file.owner->user, file.owner->group) != 0) {
    return pathFailure("set the owner of", path, errno);
  }
  if (::fchmod(descriptor, file.permissions & kPermissionBits) != 0) {
    return pathFailure("set the permissions of", path, errno);
  }
  if (const int number = accounts::flush(staged->file); number != 0) {
    return pathFailure("write", path, number);
  }
  const auto status = fileStatus(staged->file, path);
  if (!status) {
    return status.error();
  }
  staged->identity = identityOf(*status);
  return staged;
}

OrFailure<std::unique_ptr<StagedFile>> LinuxDevicePlaces::stageKept(DevicePlace place,
                                                                    std::string_view keptPath) {
  const std::string path = pathOf(place);
  const auto kept = root_.locate(keptPath);
  const auto directory = kept ? openDirectoryAt(place) : kept.error();
  auto entry = directory ? freeEntryIn((*directory)->descriptor, splitPath(path).directory)
                         : directory.error();
  const Result made = entry ? linkOrCopy(*kept, *entry) : entry.error();
  if (!made) {
    return made.error();
  }
  auto file = entry->openForItsPath();
  const auto status = file ? fileStatus(*file, path) : file.error();
  if (!status) {
    (void)entry->remove();
    return status.error();
  }
  auto staged = std::make_unique<StagedEntry>(std::move(*entry), std::move(*file));
  staged->identity = identityOf(*status);
  return staged;
}

PlaceOutcome LinuxDevicePlaces::put(DevicePlace place, StagedFile& file,
                                    const FileIdentity& expected) {
  auto& staged = static_cast<StagedEntry&>(file);
  const std::string path = pathOf(place);
  const std::string name(splitPath(path).name);
  if (expected.kind == EntryKind::Directory) {
    // It could be exchanged, but not be removed afterwards.
    return PlaceOutcome::failed(pathFailure("replace", path, EISDIR));
  }
  const FileIdentity& made = staged.identity;
  if (const int number = renameTo({place, markOf(made), markOf(expected)}, staged.entry);
      number != 0) {
    return PlaceOutcome::failed(pathFailure("rename a file to", path, number));
  }
  const int directory = staged.entry.directory();
  const char* const own = staged.entry.name();
  if (!expected.exists()) {
    const int number = renameToNothing(directory, own, name.c_str());
    if (number == EEXIST) {
      return PlaceOutcome::disturbed();
    }
    if (number != 0) {
      return PlaceOutcome::failed(pathFailure("rename a file to", path, number));
    }
    staged.isThere = false;
    const std::optional<FileIdentity> in = entryIn(directory, name.c_str());
    return !in || isSameInode(*in, made) ? PlaceOutcome::done() : PlaceOutcome::overtaken();
  }
  if (::renameat2(directory, own, directory, name.c_str(), RENAME_EXCHANGE) != 0) {
    if (errno == ENOENT) {
      return PlaceOutcome::disturbed();
    }
    if (!cannotExchange(errno)) {
      return PlaceOutcome::failed(pathFailure("exchange a file with", path, errno));
    }
    // The window that is left: what another program puts there from here on is replaced.
    if (!isSameInode(identityIn(directory, own), made) ||
        !identityIn(directory, name.c_str()).isSameFileAs(expected)) {
      return PlaceOutcome::disturbed();
    }
    if (::renameat(directory, own, directory, name.c_str()) != 0) {
      return PlaceOutcome::failed(pathFailure("rename a file to", path, errno));
    }
    staged.isThere = false;
    return PlaceOutcome::done();
  }
  staged.isThere = false;
  const std::optional<FileIdentity> out = entryIn(directory, own);
  if (!out) {
    // The file has its place. Whose came out, the next run tells by its mark.
    return PlaceOutcome::done();
  }
  if (!out->isSameFileAs(expected)) {
    handBack(place, staged.entry, name.c_str(), made, *out);
    return PlaceOutcome::overtaken();
  }
  const std::optional<FileIdentity> in = entryIn(directory, name.c_str());
  if (in && !isSameInode(*in, made)) {
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
  const std::string path = pathOf(place);
  const auto directory = openDirectoryAt(place);
  if (!directory) {
    return PlaceOutcome::failed(directory.error());
  }
  if (expected.kind == EntryKind::Directory) {
    return PlaceOutcome::failed(pathFailure("remove", path, EISDIR));
  }
  const std::string name(splitPath(path).name);
  DirectoryEntry aside((*directory)->descriptor, name, path);
  int number = renameTo({place, 0, markOf(expected)}, aside);
  if (number == ENOENT) {
    return PlaceOutcome::disturbed();
  }
  if (number == 0 && !identityIn(aside.directory(), aside.name()).isSameFileAs(expected)) {
    // Where another one stands there by now, that is newer and this one was replaced by it.
    if (renameToNothing(aside.directory(), aside.name(), name.c_str()) == EEXIST) {
      (void)aside.remove();
    }
    return PlaceOutcome::disturbed();
  }
  number = number == 0 ? aside.remove() : number;
  return number == 0 ? PlaceOutcome::done()
                     : PlaceOutcome::failed(pathFailure("remove", path, number));
}

PlaceOutcome LinuxDevicePlaces::keep(DevicePlace place, std::string_view keptPath,
                                     const FileIdentity& expected) {
  const std::string path = pathOf(place);
  const auto source = root_.locate(path);
  const auto kept = source ? root_.locate(keptPath) : source.error();
  if (!kept) {
    return PlaceOutcome::failed(kept.error());
  }
  const bool isSame = identityIn(source->directory(), source->name()).isSameFileAs(expected);
  if (!isSame) {
    return PlaceOutcome::disturbed();
  }
  if (const Result made = linkOrCopy(*source, *kept); !made) {
    return PlaceOutcome::failed(made.error());
  }
  const FileIdentity copy = identityIn(kept->directory(), kept->name());
  const bool isOther = copy.inode == expected.inode
                           ? !copy.isSameFileAs(expected)
                           : copy.size != expected.size || copy.modified != expected.modified;
  if (isOther) {
    (void)kept->remove();
    return PlaceOutcome::disturbed();
  }
  return PlaceOutcome::done();
}

Result LinuxDevicePlaces::flush(DevicePlace place) {
  const std::string path = pathOf(place);
  const auto opened = openDirectoryAt(place);
  const auto directory =
      opened ? DirectoryEntry((*opened)->descriptor, std::string(splitPath(path).name), path)
                   .openDirectory()
             : opened.error();
  if (!directory) {
    return directory.error().isMissing() ? Result() : directory.error();
  }
  return asResult("flush the directory of", path, flushDirectory(*directory));
}

Result LinuxDevicePlaces::makeInformationDirectory() {
  const std::string directory = pathOf(DevicePlace::InformationDirectory);
  if (files_.isDirectory(directory)) {
    return {};
  }
  constexpr unsigned kEverybody = 0777;
  const Result made = files_.createDirectoryWithIntermediates(directory, kEverybody);
  return made ? made : Failure{.text = made.error().text};
}

Result LinuxDevicePlaces::writeInformationFile(std::string_view name,
                                               const ReadableBytes& contents) {
  if (Result made = makeInformationDirectory(); !made) {
    return made;
  }
  const std::string directory = pathOf(DevicePlace::InformationDirectory);
  const std::string path = joinedPath(directory, name);
  const auto entry = root_.locate(path);
  const auto temporary = entry ? makeTemporaryFileIn(root_, directory) : entry.error();
  if (!temporary) {
    return temporary.error();
  }
  Result written = writeContents(contents, temporary->file, path);
  if (written) {
    int number = accounts::flush(temporary->file);
    if (number == 0 && ::renameat(temporary->entry.directory(), temporary->entry.name(),
                                  entry->directory(), entry->name()) != 0) {
      number = errno;
    }
    written = asResult("write", path, number);
  }
  if (!written) {
    (void)temporary->entry.remove();
  }
  return written;
}

}  // namespace accounts
