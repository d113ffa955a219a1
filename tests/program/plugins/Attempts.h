#pragma once

#include <string>

// What code that wants out of its process tries, chosen by the environment variable ATTEMPT. VICTIM
// names a file, VICTIM_PROCESS a process.

namespace accounts {

/// The name of what is to be tried.
std::string chosenAttempt();

/// Tries it; whether that succeeded. Each name is that of a row of the one table.
bool makeAttempt();

}  // namespace accounts
