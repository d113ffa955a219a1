#pragma once

#include <string>

#include "platform/linux/Confinement.h"

namespace accounts {

/// Allows the process, for good, a short list of system calls: those of a program that works in
/// memory on what it has open, and ends. Any other one is not made, but raises SIGSYS, whose
/// handler finds the number in `siginfo_t`. Returns 0 or the error number.
int filterSystemCalls(JournalEntries journalEntries);

/// Keeps the process, for good, from starting other programs, looking into or signalling other
/// processes, and changing what the system is: such a call is answered in the same way. No new
/// socket is made either, but that is answered as want of a permission, since the C library asks
/// for one where it can do without. Everything else stays allowed. Returns 0 or the error number.
int filterForeignCalls();

/// The name of a system call, or its number where it has none.
std::string systemCallName(int number);

}  // namespace accounts
