#pragma once

#include <chrono>
#include <cstdint>
#include <vector>

#include "platform/linux/PathFailure.h"

namespace accounts {

/// Whether `giveUpRights` does nothing. So it is in builds with sanitizers or for coverage alone:
/// their own code opens files, maps memory and starts processes to report what it found.
#if defined(ACCOUNTS_EXEMPT_FROM_CONFINEMENT)
inline constexpr bool kIsExemptFromConfinement = true;
#else
inline constexpr bool kIsExemptFromConfinement = false;
#endif

/// The most that a process may use.
struct ProcessLimits {
  /// Bytes of address space. Files that the process writes may grow by as much.
  std::uint64_t memory = 0;
  std::chrono::seconds processorTime{};
};

/// Whether a process sends long entries to the journal, as memory files beside its messages.
enum class JournalEntries : std::uint8_t { None, Sent };

/// What a process keeps when it gives up its rights.
struct Confinement {
  /// What stays open besides standard output and standard error. Everything else is closed.
  std::vector<int> descriptors;
  ProcessLimits limits;
  JournalEntries journalEntries = JournalEntries::None;
};

/// Gives up, for good, whatever a process does not need that has opened all that it works on: other
/// descriptors, the rights of the superuser, files that can be named (Landlock, where the kernel
/// has it), memory and time without end, and every system call that `SystemCallFilter.h` does not
/// list. The process dies with its parent. It must have one thread; a lower limit that it has
/// already stays. An error when that cannot be done: the process must not go on then.
Result giveUpRights(const Confinement& kept);

/// Gives up, for good, what a process does not need that changes a device by itself: files outside
/// `directory`, the device's root, which may be open for its path (Landlock, where the kernel has
/// it), and the calls of `filterForeignCalls`. Its user and its capabilities stay. An error when
/// that cannot be done: the process must not go on then.
Result giveUpForeignRights(int directory);

}  // namespace accounts
