#pragma once

#include <string>

#include "platform/linux/Confinement.h"

namespace accounts {

/// Allows the process, for good, a short list of system calls: those of a program that works in
/// memory on what it has open, and ends. Any other one is not made, but raises SIGSYS, whose
/// handler finds the number in `siginfo_t`. Returns 0 or the error number.
int filterSystemCalls(JournalEntries journalEntries);

/// The name of a system call, or its number where it has none.
std::string systemCallName(int number);

}  // namespace accounts
