#pragma once

#include <string_view>

#include "commandline/ExitStatus.h"
#include "platform/linux/LinuxPlatform.h"

namespace accounts {

/// What stands in the way of a platform, as the program's error.
ProgramError programErrorOf(const LinuxPlatformError& error);

/// A failure as the program's error, with the exit status for its kind.
ProgramError programErrorOf(const Failure& failure, ExitStatus lasting);

/// An error when a root is no device's, such as the empty directory on which an image was to be
/// mounted: it has none of the directories that every device has. `name` is the root as it was
/// named.
OrProgramError<void> checkIsDevice(const DeviceRoot& root, std::string_view name);

}  // namespace accounts
