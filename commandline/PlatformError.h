#pragma once

#include "commandline/ExitStatus.h"
#include "platform/linux/LinuxPlatform.h"

namespace accounts {

/// What stands in the way of a platform, as the program's error.
ProgramError programErrorOf(const LinuxPlatformError& error);

}  // namespace accounts
