#pragma once

#include "commandline/ExitStatus.h"
#include "platform/linux/LinuxPlatform.h"

namespace accounts {

/// What stands in the way of a platform, as the program's error.
ProgramError programErrorOf(const LinuxPlatformError& error);

/// A failure as the program's error: one that may pass has the exit status for that, every other
/// one `lasting`.
ProgramError programErrorOf(const PathError& error, ExitStatus lasting);
ProgramError programErrorOf(const Result& failure, ExitStatus lasting);

}  // namespace accounts
