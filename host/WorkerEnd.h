#pragma once

#include <optional>
#include <string_view>

#include "commandline/ExitStatus.h"
#include "platform/linux/Confinement.h"
#include "platform/linux/FileDescriptor.h"

namespace accounts {

/// Lets this process tell the host, before it ends, that it made a system call that it may not make
/// or that it had no memory. `socket` must live as long as the process.
void tellHowThisWorkerEnds(const FileDescriptor& socket);

/// What the host says of a worker that told it of such an end, by the frame's bytes. `limits` are
/// those of the worker, none for one without limits of its own.
ProgramError forbiddenCallError(std::string_view bytes);
ProgramError outOfMemoryError(const std::optional<ProcessLimits>& limits);
/// What it says of a worker that ended without a word, by what waitpid() gave.
ProgramError endedWorkerError(int status, const std::optional<ProcessLimits>& limits);

}  // namespace accounts
