#pragma once

#include <sysexits.h>

#include <string>

#include "platform/Result.h"

namespace accounts {

/// What the programs tell their callers. Errors have the numbers of sysexits.h.
enum class ExitStatus : int {
  Success = 0,
  /// accountsctl did its work, and the answer is one that the caller may want to act on.
  Attention = 1,
  /// The plug-in ran and reported failure.
  MigrationFailed = 1,
  /// The plug-in reported success, but that could not be verified; nothing is changed.
  NotVerified = 2,
  /// Migrated, but not everything was carried over; what was not is kept.
  NotAllCarriedOver = 3,
  /// The arguments cannot be used; nothing was done.
  UnusableArguments = EX_USAGE,
  /// The input is there but is not what it has to be.
  MalformedInput = EX_DATAERR,
  /// The input is missing or unreadable.
  MissingInput = EX_NOINPUT,
  /// The plug-in ended by an assertion, a signal or an exit of its own.
  PluginEnded = EX_SOFTWARE,
  /// An output file, or one of the program's own, cannot be created.
  CannotCreate = EX_CANTCREAT,
  /// A file or stream cannot be written or read.
  InputOutputError = EX_IOERR,
  /// What stands in the way may pass: the same again may succeed.
  TemporaryFailure = EX_TEMPFAIL
};

/// What a program tells of a failure: one of a medium is an input/output error, one that may pass
/// is a temporary failure, and every other is `lasting`.
inline ExitStatus exitStatusOf(const Failure& failure, ExitStatus lasting) {
  switch (failure.kind()) {
    case FailureKind::OfTheMedium:
      return ExitStatus::InputOutputError;
    case FailureKind::MayPass:
      return ExitStatus::TemporaryFailure;
    case FailureKind::Lasting:
      break;
  }
  return lasting;
}

/// Why a program could not do what it was asked to.
struct ProgramError {
  ExitStatus exitStatus = ExitStatus::InputOutputError;
  /// One line for a person, without a full stop.
  std::string message;
};

/// What a part of a program that can fail gives back.
template <class Value>
using OrProgramError = OrError<Value, ProgramError>;

}  // namespace accounts
