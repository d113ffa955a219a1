#include "tests/program/HostileKind.h"

#include <fcntl.h>
#include <linux/fs.h>
#include <sys/ioctl.h>
#include <sys/socket.h>
#include <sys/stat.h>
#include <sys/sysmacros.h>
#include <sys/un.h>
#include <unistd.h>

#include <cerrno>
#include <cstring>
#include <fstream>

namespace accounts {
namespace {

namespace fs = std::filesystem;
using Reason = std::optional<std::string>;

constexpr mode_t kEverybody = 0666;
constexpr off_t kHugeSize = off_t{1} << 40;

Reason reasonUnless(bool made, const char* what) {
  return made ? Reason() : Reason(std::string("No ") + what + " here: " + std::strerror(errno));
}

Reason putAbsoluteLink(const fs::path& place, const fs::path& outside) {
  fs::remove_all(place);
  fs::create_symlink(outside, place);
  return {};
}

Reason putRelativeLink(const fs::path& place, const fs::path& outside) {
  // More steps up than the place is deep, wherever the temporary directories are.
  fs::path target;
  for (int step = 0; step < 40; ++step) {
    target /= "..";
  }
  return putAbsoluteLink(place, target / outside.relative_path());
}

Reason putLinkToLink(const fs::path& place, const fs::path& outside) {
  fs::path between = place;
  between += ".link";
  fs::create_symlink(outside, between);
  return putAbsoluteLink(place, between.filename());
}

Reason putLinkToNothing(const fs::path& place, const fs::path& outside) {
  fs::path missing = outside;
  missing += ".missing";
  return putAbsoluteLink(place, missing);
}

Reason putLinkToItself(const fs::path& place, const fs::path&) {
  return putAbsoluteLink(place, place.filename());
}

Reason putNamedPipe(const fs::path& place, const fs::path&) {
  fs::remove_all(place);
  return reasonUnless(mkfifo(place.c_str(), kEverybody) == 0, "named pipes");
}

Reason putSocket(const fs::path& place, const fs::path&) {
  fs::remove_all(place);
  // The names of sockets are short: bound from its directory, which is put back at once.
  const fs::path before = fs::current_path();
  fs::current_path(place.parent_path());
  sockaddr_un address = {};
  address.sun_family = AF_UNIX;
  place.filename().string().copy(address.sun_path, sizeof address.sun_path - 1);
  const int descriptor = socket(AF_UNIX, SOCK_STREAM | SOCK_CLOEXEC, 0);
  const bool made = bind(descriptor, reinterpret_cast<sockaddr*>(&address), sizeof address) == 0;
  const Reason reason = reasonUnless(made, "sockets");
  close(descriptor);
  fs::current_path(before);
  return reason;
}

Reason putDevice(const fs::path& place, mode_t kind, dev_t number) {
  fs::remove_all(place);
  return reasonUnless(mknod(place.c_str(), kind | kEverybody, number) == 0, "device nodes");
}

// One that gives zeros without end.
Reason putCharacterDevice(const fs::path& place, const fs::path&) {
  return putDevice(place, S_IFCHR, makedev(1, 5));
}

Reason putBlockDevice(const fs::path& place, const fs::path&) {
  return putDevice(place, S_IFBLK, makedev(7, 200));
}

Reason putFile(const fs::path& place, const fs::path&) {
  fs::remove_all(place);
  std::ofstream(place) << "a file where a directory belongs";
  return {};
}

Reason putDirectory(const fs::path& place, const fs::path&) {
  fs::remove_all(place);
  fs::create_directory(place);
  std::ofstream(place / "file") << "a file where no directory belongs";
  return {};
}

Reason putHugeFile(const fs::path& place, const fs::path&) {
  std::ofstream(place, std::ios::app).close();
  return reasonUnless(truncate(place.c_str(), kHugeSize) == 0, "file of a terabyte");
}

Reason putUnreadable(const fs::path& place, const fs::path&) {
  if (!fs::exists(place)) {
    std::ofstream(place).close();
  }
  return reasonUnless(chown(place.c_str(), 0, 0) == 0 && chmod(place.c_str(), 0) == 0,
                      "files of another user");
}

bool setImmutable(const fs::path& place, bool immutable) {
  const int descriptor = open(place.c_str(), O_RDONLY | O_NONBLOCK | O_NOFOLLOW | O_CLOEXEC);
  unsigned flags = 0;
  bool done = ioctl(descriptor, FS_IOC_GETFLAGS, &flags) == 0;
  flags = immutable ? flags | FS_IMMUTABLE_FL : flags & ~static_cast<unsigned>(FS_IMMUTABLE_FL);
  done = done && ioctl(descriptor, FS_IOC_SETFLAGS, &flags) == 0;
  close(descriptor);
  return done;
}

Reason putImmutable(const fs::path& place, const fs::path&) {
  if (!fs::exists(place)) {
    std::ofstream(place).close();
  }
  return reasonUnless(setImmutable(place, true), "immutable files");
}

constexpr HostileKind kFileKinds[] = {
    {"AnAbsoluteLinkOut", putAbsoluteLink, Finding::Nothing, Finding::Refused},
    {"ARelativeLinkOut", putRelativeLink, Finding::Nothing, Finding::Refused},
    {"ALinkToALinkOut", putLinkToLink, Finding::Nothing, Finding::Refused},
    {"ALinkToNothing", putLinkToNothing, Finding::Nothing, Finding::Refused},
    {"ALinkToItself", putLinkToItself, Finding::Refused},
    {"ANamedPipe", putNamedPipe, Finding::Refused},
    {"ASocket", putSocket, Finding::Refused},
    {"ACharacterDevice", putCharacterDevice, Finding::Refused},
    {"ABlockDevice", putBlockDevice, Finding::Refused},
    {"ADirectory", putDirectory, Finding::Refused},
    {"AHugeFile", putHugeFile, Finding::Refused, Finding::Usable},
    {"AnImmutableFile", putImmutable, Finding::Usable},
    {.name = "AnUnreadableFile",
     .put = putUnreadable,
     .finding = Finding::Refused,
     .toOtherUsersOnly = true},
};

constexpr HostileKind kDirectoryKinds[] = {
    {"AnAbsoluteLinkOut", putAbsoluteLink, Finding::Nothing, Finding::Refused},
    {"ARelativeLinkOut", putRelativeLink, Finding::Nothing, Finding::Refused},
    {"ALinkToALinkOut", putLinkToLink, Finding::Nothing, Finding::Refused},
    {"ALinkToNothing", putLinkToNothing, Finding::Nothing, Finding::Refused},
    {"ALinkToItself", putLinkToItself, Finding::Refused},
    {"ANamedPipe", putNamedPipe, Finding::Nothing, Finding::Refused},
    {"ACharacterDevice", putCharacterDevice, Finding::Nothing, Finding::Refused},
    {"AFile", putFile, Finding::Nothing, Finding::Refused},
    // Nothing can be made in it, the lock neither.
    {"AnImmutableDirectory", putImmutable, Finding::Usable, Finding::Refused},
    {.name = "AnUnreadableDirectory",
     .put = putUnreadable,
     .finding = Finding::Refused,
     .toOtherUsersOnly = true},
};

const HostileKind& kindNamed(std::span<const HostileKind> kinds, std::string_view name) {
  for (const HostileKind& kind : kinds) {
    if (kind.name == name) {
      return kind;
    }
  }
  ADD_FAILURE() << "no hostile kind is named " << name;
  return kinds.front();
}

}  // namespace

std::span<const HostileKind> hostileFileKinds() {
  return kFileKinds;
}

std::span<const HostileKind> hostileDirectoryKinds() {
  return kDirectoryKinds;
}

const HostileKind& hostileFileKind(std::string_view name) {
  return kindNamed(kFileKinds, name);
}

const HostileKind& hostileDirectoryKind(std::string_view name) {
  return kindNamed(kDirectoryKinds, name);
}

void makeRemovable(const fs::path& place) {
  (void)setImmutable(place, false);
}

}  // namespace accounts
