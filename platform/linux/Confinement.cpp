#include "platform/linux/Confinement.h"

#include <grp.h>
#include <linux/capability.h>
#include <sys/prctl.h>
#include <sys/resource.h>
#include <sys/stat.h>
#include <sys/syscall.h>
#include <unistd.h>

#include <algorithm>
#include <array>
#include <cerrno>
#include <climits>
#include <csignal>
#include <cstdlib>
#include <string_view>

#include "platform/linux/LandlockDomain.h"
#include "platform/linux/SystemCallFilter.h"

namespace accounts {
namespace {

/// The number that belongs to nobody, as user and as group.
constexpr unsigned kNobody = 65534;
/// More than a worker has open, and the few that it may still get.
constexpr rlim_t kMostDescriptors = 64;

Failure cannotGiveUp(std::string_view right, int number) {
  return pathFailure("give up", right, number);
}

/// Closes all descriptors but the standard output and error streams and those of a list.
bool closeOthers(std::vector<int> kept) {
  kept.insert(kept.end(), {STDOUT_FILENO, STDERR_FILENO});
  std::sort(kept.begin(), kept.end());
  unsigned next = 0;
  for (const int number : kept) {
    const auto descriptor = static_cast<unsigned>(number);
    if (next < descriptor && ::close_range(next, descriptor - 1, 0) != 0) {
      return false;
    }
    next = descriptor + 1;
  }
  return ::close_range(next, UINT_MAX, 0) == 0;
}

/// Lowers a limit; one that is lower already stays.
bool limit(int resource, rlim_t soft, rlim_t hard) {
  rlimit now = {};
  if (::getrlimit(static_cast<__rlimit_resource>(resource), &now) != 0) {
    return false;
  }
  now.rlim_max = std::min(now.rlim_max, hard);
  now.rlim_cur = std::min({now.rlim_cur, soft, now.rlim_max});
  return ::setrlimit(static_cast<__rlimit_resource>(resource), &now) == 0;
}

/// How large a file that is written may become: logs that are long already may grow, too.
rlim_t largestFile(const Confinement& kept) {
  rlim_t largest = 0;
  std::vector<int> descriptors = kept.descriptors;
  descriptors.push_back(STDERR_FILENO);
  for (const int descriptor : descriptors) {
    struct stat status = {};
    if (::fstat(descriptor, &status) == 0 && S_ISREG(status.st_mode)) {
      largest = std::max(largest, static_cast<rlim_t>(status.st_size));
    }
  }
  return largest + kept.limits.memory;
}

bool limitResources(const Confinement& kept) {
  const auto seconds = static_cast<rlim_t>(kept.limits.processorTime.count());
  const rlim_t file = largestFile(kept);
  // A log that becomes too long loses lines.
  ::signal(SIGXFSZ, SIG_IGN);
  // The first end of the processor time is a signal of its own, the second one kills.
  return limit(RLIMIT_CORE, 0, 0) && limit(RLIMIT_NPROC, 0, 0) &&
         limit(RLIMIT_NOFILE, kMostDescriptors, kMostDescriptors) &&
         limit(RLIMIT_FSIZE, file, file) && limit(RLIMIT_CPU, seconds, seconds + 1) &&
         limit(RLIMIT_AS, kept.limits.memory, kept.limits.memory);
}

/// Becomes nobody, when it is the superuser. In a namespace of users that knows only the superuser
/// it stays what it is; it loses its capabilities in any case.
bool becomeNobody() {
  if (::geteuid() != 0) {
    return true;
  }
  const bool isNobody = ::setgroups(0, nullptr) == 0 &&
                        ::setresgid(kNobody, kNobody, kNobody) == 0 &&
                        ::setresuid(kNobody, kNobody, kNobody) == 0;
  return isNobody || errno == EINVAL || errno == EPERM;
}

bool dropCapabilities() {
  __user_cap_header_struct header = {.version = _LINUX_CAPABILITY_VERSION_3, .pid = 0};
  const std::array<__user_cap_data_struct, _LINUX_CAPABILITY_U32S_3> none{};
  return ::syscall(SYS_capset, &header, none.data()) == 0;
}

}  // namespace

Result giveUpRights(const Confinement& kept) {
  if (kIsExemptFromConfinement) {
    return {};
  }
  const pid_t parent = ::getppid();
  if (!closeOthers(kept.descriptors)) {
    return cannotGiveUp("open files", errno);
  }
  if (!limitResources(kept)) {
    return cannotGiveUp("memory and time", errno);
  }
  if (!becomeNobody()) {
    return cannotGiveUp("the user", errno);
  }
  if (!dropCapabilities()) {
    return cannotGiveUp("the capabilities", errno);
  }
  // Nobody else who is nobody looks into its memory. Becoming nobody ended the request to die with
  // the parent, which may have gone meanwhile.
  if (::prctl(PR_SET_DUMPABLE, 0) != 0 || ::prctl(PR_SET_NO_NEW_PRIVS, 1, 0, 0, 0) != 0 ||
      ::prctl(PR_SET_PDEATHSIG, SIGKILL) != 0) {
    return cannotGiveUp("new rights", errno);
  }
  if (::getppid() != parent) {
    ::_exit(EXIT_FAILURE);
  }
  if (const int number = enterLandlockDomain(); number != 0) {
    return cannotGiveUp("the files", number);
  }
  const int number = filterSystemCalls(kept.journalEntries);
  return number != 0 ? cannotGiveUp("system calls", number) : Result();
}

Result giveUpForeignRights(int directory) {
  if (kIsExemptFromConfinement) {
    return {};
  }
  if (::prctl(PR_SET_NO_NEW_PRIVS, 1, 0, 0, 0) != 0) {
    return cannotGiveUp("new rights", errno);
  }
  if (const int number = enterLandlockDomainOf(directory); number != 0) {
    return cannotGiveUp("files outside the root", number);
  }
  const int number = filterForeignCalls();
  return number != 0 ? cannotGiveUp("system calls", number) : Result();
}

}  // namespace accounts
