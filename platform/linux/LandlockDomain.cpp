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

}  // namespace

int enterLandlockDomain() {
  const long known =
      ::syscall(SYS_landlock_create_ruleset, nullptr, 0, LANDLOCK_CREATE_RULESET_VERSION);
  const Version* newest = nullptr;
  for (const Version& version : kVersions) {
    if (version.number <= known) {
      newest = &version;
    }
  }
  if (newest == nullptr) {
    return 0;
  }
  // Without a single rule nothing that is handled is allowed.
  const FileDescriptor ruleset(
      static_cast<int>(::syscall(SYS_landlock_create_ruleset, &newest->handled, newest->size, 0)));
  const bool isRestricted =
      ruleset.number() >= 0 && ::syscall(SYS_landlock_restrict_self, ruleset.number(), 0) == 0;
  return isRestricted ? 0 : errno;
}

}  // namespace accounts
