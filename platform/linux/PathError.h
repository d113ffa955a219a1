#pragma once

#include <sys/stat.h>

#include <string>
#include <string_view>

#include "platform/Result.h"

namespace accounts {

/// Why an operation on a path failed.
struct PathError {
  /// The system's error number (errno); 0 when the reason is not the system's.
  int number = 0;
  /// What could not be done, to which path, and why, for an engineer.
  std::string text;

  /// Whether the reason is that nothing exists at the path.
  [[nodiscard]] bool isMissing() const;
};

/// The kind of failure that a system error number stands for: those of room, of media and of the
/// system's own means may pass.
FailureKind failureKind(int number);

/// The error "Cannot OPERATION PATH: REASON" for a system error number. `operation` is a verb with
/// what belongs to it, such as "open".
PathError pathError(std::string_view operation, std::string_view path, int number);
/// The same for a reason that the system has no number for.
PathError pathError(std::string_view operation, std::string_view path, std::string_view reason);

/// The error for something at a path that is no regular file; `mode` is what stat gave for it.
PathError notRegularError(std::string_view operation, std::string_view path, mode_t mode);

}  // namespace accounts
