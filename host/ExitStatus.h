#pragma once

#include <sysexits.h>

namespace accounts {

/// What the program tells its caller. Errors of the host's own have the numbers of sysexits.h.
enum class ExitStatus : int {
  /// The plug-in reported success.
  Success = 0,
  /// The plug-in ran and reported failure.
  MigrationFailed = 1,
  /// The plug-in reported success, but that could not be verified; its inputs were put back.
  NotVerified = 2,
  /// The arguments cannot be used; nothing was done.
  UnusableArguments = EX_USAGE,
  /// No such root, device description or bundle, or an unreadable one; nothing was done.
  MissingInput = EX_NOINPUT,
  /// The plug-in ended by an assertion, a signal or an exit of its own.
  PluginEnded = EX_SOFTWARE,
  /// A file of the host's own cannot be created.
  CannotCreate = EX_CANTCREAT,
  /// A file or stream of the host's own cannot be written or read.
  InputOutputError = EX_IOERR
};

}  // namespace accounts
