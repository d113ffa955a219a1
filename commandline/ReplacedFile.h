#pragma once

#include <optional>
#include <string>
#include <string_view>

#include "commandline/ExitStatus.h"

namespace accounts {

/// Writes a file of this machine so that a reader sees the old file or the whole new one. A name
/// without a directory stands for a file in the working directory. A new file can be read by its
/// owner alone; one that is replaced keeps its owner, group and permissions. Symbolic links are
/// followed. A pipe that somebody reads is written to. None when it is done; an error, with nothing
/// changed, when anything else is there or the file cannot be made or written.
/// When a file is to be replaced at the end of some work, whyNotReplaceable() tells at its
/// beginning whether it could be now.
std::optional<ProgramError> replaceFile(const std::string& path, std::string_view contents);

/// The error that replaceFile() would give before it writes; none when it would give none. Nothing
/// is left changed.
std::optional<ProgramError> whyNotReplaceable(const std::string& path);

}  // namespace accounts
