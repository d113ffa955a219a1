#pragma once

#include <sysexits.h>

#include <string>

namespace accounts {

/// What a program tells its caller. Errors have the numbers of sysexits.h.
enum class ExitStatus : int {
  Success = 0,
  /// The program did its work, and the answer is one that the caller may want to act on.
  Attention = 1,
  /// The arguments cannot be used; nothing was done.
  UnusableArguments = EX_USAGE,
  /// The input is there but is not what it has to be.
  MalformedInput = EX_DATAERR,
  /// The input is missing or unreadable.
  MissingInput = EX_NOINPUT,
  /// An output file cannot be created.
  CannotCreate = EX_CANTCREAT,
  /// A file or stream cannot be written or read.
  InputOutputError = EX_IOERR
};

/// Why a program could not do what it was asked to.
struct ProgramError {
  ExitStatus exitStatus = ExitStatus::InputOutputError;
  /// One line for a person, without a full stop.
  std::string message;
};

}  // namespace accounts
