#pragma once

#include <optional>

#include "commandline/ExitStatus.h"

namespace accounts {

/// Lets the stack of this process, and of those that it forks, grow as far as property lists of any
/// depth need, whatever it was limited to. An error where no more is allowed; it may pass.
OrProgramError<void> askForStack();

}  // namespace accounts
