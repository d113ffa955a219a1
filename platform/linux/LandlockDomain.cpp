#include "platform/linux/LandlockDomain.h"

#include <linux/landlock.h>
#include <sys/syscall.h>
#include <unistd.h>

#include <cerrno>
#include <cstddef>
#include <cstdint>

#include "platform/linux/FileDescriptor.h"

namespace accounts {
namespace {

/// What the kernel's own structure is in its newest version; older ones know the beginning of it.
struct HandledAccess {
  std::uint64_t files = 0;
  std::uint64_t network = 0;
  std::uint64_t scoped = 0;
};

/// What a version of the interface was the first to know.
struct Version {
  long number;
  HandledAccess handled;
  std::size_t size;
};

constexpr std::uint64_t bits(unsigned count) {
  return (std::uint64_t{1} << count) - 1;
}

constexpr std::size_t kFilesAlone = sizeof(std::uint64_t);
constexpr std::size_t kWithNetwork = 2 * sizeof(std::uint64_t);

constexpr Version kVersions[] = {
    {1, {.files = bits(13)}, kFilesAlone},
    {2, {.files = bits(14)}, kFilesAlone},                       // linking
    {3, {.files = bits(15)}, kFilesAlone},                       // truncating
    {4, {.files = bits(15), .network = bits(2)}, kWithNetwork},  // TCP
    {5, {.files = bits(16), .network = bits(2)}, kWithNetwork},  // ioctl
    {6, {.files = bits(16), .network = bits(2), .scoped = bits(2)}, sizeof(HandledAccess)},
};

/// What changes a file or a directory, of all that the newest version knows.
constexpr std::uint64_t kReading =
    LANDLOCK_ACCESS_FS_EXECUTE | LANDLOCK_ACCESS_FS_READ_FILE | LANDLOCK_ACCESS_FS_READ_DIR;
constexpr std::uint64_t kChanging = bits(15) & ~kReading;
constexpr long kFirstThatMovesBetweenDirectories = 2;

/// The newest version of the kernel's that is known here; null for none.
const Version* newestVersion() {
  const long known =
      ::syscall(SYS_landlock_create_ruleset, nullptr, 0, LANDLOCK_CREATE_RULESET_VERSION);
  const Version* newest = nullptr;
  for (const Version& version : kVersions) {
    if (version.number <= known) {
      newest = &version;
    }
  }
  return newest;
}

/// Without a rule nothing that is handled is allowed.
FileDescriptor makeRuleset(const HandledAccess& handled, const Version& version) {
  return FileDescriptor(
      static_cast<int>(::syscall(SYS_landlock_create_ruleset, &handled, version.size, 0)));
}

int enter(const FileDescriptor& ruleset) {
  return ::syscall(SYS_landlock_restrict_self, ruleset.number(), 0) == 0 ? 0 : errno;
}

}  // namespace

int enterLandlockDomain() {
  const Version* const version = newestVersion();
  if (version == nullptr) {
    return 0;
  }
  const FileDescriptor ruleset = makeRuleset(version->handled, *version);
  return ruleset.number() >= 0 ? enter(ruleset) : errno;
}

int enterLandlockDomainOf(int directory) {
  const Version* const version = newestVersion();
  if (version == nullptr || version->number < kFirstThatMovesBetweenDirectories) {
    return 0;
  }
  const std::uint64_t changes = kChanging & version->handled.files;
  const FileDescriptor ruleset =
      makeRuleset({.files = changes, .scoped = version->handled.scoped}, *version);
  const landlock_path_beneath_attr rule = {.allowed_access = changes, .parent_fd = directory};
  const bool isMade = ruleset.number() >= 0 && ::syscall(SYS_landlock_add_rule, ruleset.number(),
                                                         LANDLOCK_RULE_PATH_BENEATH, &rule, 0) == 0;
  return isMade ? enter(ruleset) : errno;
}

}  // namespace accounts
