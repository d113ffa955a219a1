#include "platform/linux/LinuxDevicePlaces.h"

#include <fcntl.h>
#include <sys/stat.h>
#include <unistd.h>

#include <algorithm>
#include <cerrno>
#include <utility>

#include "platform/linux/EntryIdentity.h"
#include "platform/linux/FileContents.h"
#include "platform/linux/OpenedBytes.h"
#include "vocabulary/DevicePath.h"

namespace accounts {
namespace {

/// The places that a migration reads: what cannot be read there must not count as missing.
constexpr std::array kReadPlaces = {DevicePlace::Settings, DevicePlace::LegacyExchange,
                                    DevicePlace::LegacyMail, DevicePlace::LoggingPreferences,
                                    DevicePlace::CommitRecord};

bool isRead(DevicePlace place) {
  return std::ranges::find(kReadPlaces, place) != kReadPlaces.end();
}

/// Whether a migration decides by what is there: a place of which that cannot be told is an error.
bool isDecisive(DevicePlace place) {
  return isRead(place) || place == DevicePlace::RemovalSentinel;
}

bool isMissing(int number) {
  return number == ENOENT || number == ENOTDIR;
}

/// Why the names of a directory may not be changed by this process; 0 for none.
int whyNotChanged(const FileDescriptor& directory) {
  return ::faccessat(directory.number(), ".", W_OK | X_OK, AT_EACCESS) == 0 ? 0 : errno;
}

/// Whether nobody may rename or remove a file, whatever the directory allows. The kernel answers
/// for a file that is immutable as if it were to be written.
bool isImmutable(const FileDescriptor& directory, const char* name) {
  return ::faccessat(directory.number(), name, W_OK, AT_EACCESS | AT_SYMLINK_NOFOLLOW) != 0 &&
         errno == EPERM;
}

/// Opens a file that was found to be a regular one.
OrFailure<FileDescriptor> openIn(const FileDescriptor& directory, const std::string& path) {
  const std::string name(splitPath(path).name);
  const int flags = O_RDONLY | O_NOFOLLOW | O_NONBLOCK | O_CLOEXEC | O_NOCTTY;
  const int number = ::openat(directory.number(), name.c_str(), flags);
  if (number < 0) {
    return pathFailure("open", path, errno);
  }
  return FileDescriptor(number);
}

/// Whether a directory such as /tmp lets only the owner of a file rename or remove it.
bool keepsForItsOwner(const struct stat& directory, const struct stat& file) {
  const uid_t user = ::geteuid();
  return (directory.st_mode & S_ISVTX) != 0 && user != 0 && file.st_uid != user &&
         directory.st_uid != user;
}

}  // namespace

LinuxDevicePlaces::LinuxDevicePlaces(const DeviceRoot& root, LinuxFileSystem& files,
                                     std::string home, ReadOnlyMounts readOnlyMounts)
    : root_(root), files_(files), home_(std::move(home)), readOnlyMounts_(readOnlyMounts) {}

OrFailure<DeviceSnapshot> LinuxDevicePlaces::takeSnapshot() {
  directories_ = {};
  opened_.clear();
  metReadOnlyMount_ = false;
  DeviceSnapshot snapshot;
  for (const ListedPlace& each : kDevicePlaces) {
    PlaceState& state = snapshot.places[indexOf(each.place)];
    state.path = pathOf(each.place);
    if (const Result looked = look(each.place, state); !looked) {
      return looked.error();
    }
  }
  if (const Result apart = checkThatNoTwoAreOne(); !apart) {
    return apart.error();
  }
  snapshot.isReadOnly = metReadOnlyMount_;
  return snapshot;
}

int LinuxDevicePlaces::numberThatCounts(int number) const {
  return number == EROFS && readOnlyMounts_ == ReadOnlyMounts::Overlook ? 0 : number;
}

OrFailure<std::shared_ptr<const LinuxDevicePlaces::Directory>> LinuxDevicePlaces::directoryOf(
    const std::string& path) {
  const std::string_view parent = splitPath(path).directory;
  if (const auto known = opened_.find(parent); known != opened_.end()) {
    return known->second;
  }
  auto descriptor = root_.open(parent, O_PATH | O_DIRECTORY);
  const auto status = descriptor ? fileStatus(*descriptor, parent) : descriptor.error();
  if (!status) {
    return status.error();
  }
  const int number = whyNotChanged(*descriptor);
  metReadOnlyMount_ = metReadOnlyMount_ || number == EROFS;
  auto directory = std::make_shared<const Directory>(
      Directory{std::make_shared<const FileDescriptor>(*std::move(descriptor)), *status,
                numberThatCounts(number)});
  opened_.emplace(parent, directory);
  return directory;
}

OrFailure<std::shared_ptr<const LinuxDevicePlaces::Directory>> LinuxDevicePlaces::openDirectoryAt(
    DevicePlace place) {
  auto& directory = directories_[indexOf(place)];
  if (directory == nullptr) {
    auto opened = directoryOf(pathOf(place));
    if (!opened) {
      return opened;
    }
    directory = *std::move(opened);
  }
  return directory;
}

Result LinuxDevicePlaces::look(DevicePlace place, PlaceState& state) {
  const auto opened = directoryOf(state.path);
  if (!opened) {
    const Failure& error = opened.error();
    if (isDecisive(place) && !isMissing(error.number)) {
      return error;
    }
    state.whyNotRead = pathFailure("open", state.path, error.number);
    state.whyNotRemoved = error;
    if (place == DevicePlace::InformationDirectory) {
      // It is made with its parents; a file is then made in what is the system's own.
      foreseeInformationDirectory(state);
    } else {
      state.whyNotReplaced = error;
    }
    return {};
  }
  const auto& directory = *opened;
  directories_[indexOf(place)] = directory;
  const std::string name(splitPath(state.path).name);
  struct stat status = {};
  if (::fstatat(directory->descriptor->number(), name.c_str(), &status, AT_SYMLINK_NOFOLLOW) == 0) {
    state.identity = identityOf(status);
  } else if (const int number = errno; number != ENOENT) {
    if (isDecisive(place)) {
      return pathFailure("examine", state.path, number);
    }
    state.whyNotRead = pathFailure("open", state.path, number);
    state.whyNotReplaced = pathFailure("create", state.path, number);
    state.whyNotRemoved = pathFailure("remove", state.path, number);
    state.whyNotMade = pathFailure("create the directory", state.path, number);
    return {};
  }
  Result looked = lookAtTarget(place, state);
  if (looked) {
    foresee(place, *directory, status, state);
  }
  return looked;
}

Result LinuxDevicePlaces::lookAtTarget(DevicePlace place, PlaceState& state) {
  state.target = state.identity.kind;
  if (!isRead(place)) {
    return state.target == EntryKind::Other ? lookThroughLink(place, state) : Result();
  }
  // A regular file is opened where it was found; anything else might be a link to one.
  auto file = state.identity.kind == EntryKind::RegularFile
                  ? openIn(*directoryAt(place)->descriptor, state.path)
                  : root_.openRegularFile(state.path);
  const auto opened = file ? fileStatus(*file, state.path) : file.error();
  if (!opened) {
    const Failure& error = opened.error();
    // An error without a number says that it is no regular file.
    if (error.number != 0 && !isMissing(error.number) && isDecisive(place)) {
      return error;
    }
    state.target = error.number == 0 ? EntryKind::Other : EntryKind::Nothing;
    if (files_.isDirectory(state.path)) {
      state.target = EntryKind::Directory;
    }
    state.whyNotRead = error;
    return {};
  }
  if (state.identity.kind == EntryKind::RegularFile) {
    state.identity = identityOf(*opened);
  }
  state.target = EntryKind::RegularFile;
  if (opened->st_size > static_cast<off_t>(kLargestFileSize)) {
    return pathFailure("read", state.path, EFBIG);
  }
  state.permissions = opened->st_mode & kPermissionBits;
  state.contents = std::make_shared<OpenedBytes>(std::move(*file), state.path);
  return {};
}

Result LinuxDevicePlaces::lookThroughLink(DevicePlace place, PlaceState& state) {
  const auto entry = root_.open(state.path, O_PATH);
  const auto status = entry ? fileStatus(*entry, state.path) : entry.error();
  if (!status && isDecisive(place) && !isMissing(status.error().number)) {
    return status.error();
  }
  state.target = status ? kindOfMode(status->st_mode) : EntryKind::Nothing;
  return {};
}

void LinuxDevicePlaces::foresee(DevicePlace place, const Directory& directory,
                                const struct stat& status, PlaceState& state) const {
  int number = directory.whyNotChanged;
  if (number == 0 && state.identity.exists()) {
    const std::string name(splitPath(state.path).name);
    const bool isKept = keepsForItsOwner(directory.status, status) ||
                        isImmutable(*directory.descriptor, name.c_str());
    number = isKept ? EPERM : 0;
  }
  const auto why = [&](std::string_view operation, int reason) {
    return reason == 0 ? std::nullopt : std::optional(pathFailure(operation, state.path, reason));
  };
  const bool isDirectory = state.identity.kind == EntryKind::Directory;
  // Where nothing may be written, the kernel does not look whether the file is there.
  const bool isMissed = !state.identity.exists() && number != EROFS;
  state.whyNotRemoved = why("remove", isMissed      ? ENOENT
                                      : number != 0 ? number
                                      : isDirectory ? EISDIR
                                                    : 0);
  if (place == DevicePlace::InformationDirectory) {
    // A file is made in it, and takes nobody's place.
    state.whyNotMade = state.identity.exists()
                           ? std::nullopt
                           : why("create the directory", directory.whyNotChanged);
    const auto own = root_.open(state.path, O_PATH | O_DIRECTORY);
    state.whyNotReplaced =
        own ? why("create a file in", numberThatCounts(whyNotChanged(*own))) : std::nullopt;
    return;
  }
  state.whyNotReplaced = why("create", number != 0 ? number : isDirectory ? EISDIR : 0);
}

void LinuxDevicePlaces::foreseeInformationDirectory(PlaceState& state) {
  std::size_t end = state.path.find('/', 1);
  for (; end != std::string::npos; end = state.path.find('/', end + 1)) {
    const std::string parent = state.path.substr(0, end);
    if (root_.open(parent, O_PATH | O_DIRECTORY)) {
      continue;
    }
    const auto opened = directoryOf(parent);
    if (!opened) {
      state.whyNotMade = opened.error();
      return;
    }
    const auto& directory = *opened;
    const std::string name(splitPath(parent).name);
    const auto isThere = [&] {
      struct stat status = {};
      return ::fstatat(directory->descriptor->number(), name.c_str(), &status,
                       AT_SYMLINK_NOFOLLOW) == 0;
    };
    if (isThere()) {
      state.whyNotMade = pathFailure("create the directory", parent, EEXIST);
    } else if (directory->whyNotChanged != 0) {
      state.whyNotMade = pathFailure("create the directory", parent, directory->whyNotChanged);
    }
    return;
  }
}

Result LinuxDevicePlaces::checkThatNoTwoAreOne() const {
  for (std::size_t one = 0; one < kDevicePlaceCount; ++one) {
    for (std::size_t other = one + 1; other < kDevicePlaceCount; ++other) {
      const auto& first = directories_[one];
      const auto& second = directories_[other];
      const std::string firstPath = pathOf(kDevicePlaces[one].place);
      const std::string secondPath = pathOf(kDevicePlaces[other].place);
      if (first != nullptr && second != nullptr && first->status.st_dev == second->status.st_dev &&
          first->status.st_ino == second->status.st_ino &&
          splitPath(firstPath).name == splitPath(secondPath).name) {
        return Failure{0, firstPath + " and " + secondPath +
                              " are one file: their directories lead to one "
                              "another"};
      }
    }
  }
  return {};
}

OrFailure<FileIdentity> LinuxDevicePlaces::identityAt(DevicePlace place) {
  const auto directory = openDirectoryAt(place);
  const std::string path = pathOf(place);
  if (!directory) {
    return directory.error().isMissing() ? FileIdentity()
                                         : OrFailure<FileIdentity>(directory.error());
  }
  const std::string name(splitPath(path).name);
  const auto found = entryIn((*directory)->descriptor->number(), name.c_str());
  if (!found) {
    return pathFailure("examine", path, errno);
  }
  return *found;
}

}  // namespace accounts
