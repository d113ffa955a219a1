#pragma once

#include <string>
#include <string_view>

#include "commandline/ExitStatus.h"

namespace accounts {

/// Writes a file of this machine so that a reader sees the old file or the whole new one. A name
/// without a directory stands for a file in the working directory. A new file can be read by its
/// owner alone; one that is replaced keeps its owner, group and permissions. Symbolic links are
/// followed. A pipe that somebody reads is written to. An error, with nothing changed, when
/// anything else is there or the file cannot be made or written. When a file is to be replaced at
/// the end of some work, checkReplaceable() tells at its beginning whether it could be now.
OrProgramError<void> replaceFile(const std::string& path, std::string_view contents);

/// The error that replaceFile() would give before it writes. Nothing is left changed.
OrProgramError<void> checkReplaceable(const std::string& path);

}  // namespace accounts
