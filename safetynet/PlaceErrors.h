#pragma once

#include <string_view>

#include "commandline/ExitStatus.h"

namespace accounts {

/// What a program says when something at a place could not be read: that of no permission, of too
/// many links or too much is lasting, that of a medium an input/output error; want of memory or of
/// descriptors may pass.
ProgramError readingError(const Failure& failure);

/// The same when something could not be written or removed. `operation` says what for, such as
/// "The settings file cannot be written"; a failure with no system error number cannot be mended by
/// trying again.
ProgramError writingError(std::string_view operation, const Failure& failure);

}  // namespace accounts
