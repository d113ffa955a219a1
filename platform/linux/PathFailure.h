#pragma once

#include <sys/stat.h>

#include <string_view>

#include "platform/Result.h"

namespace accounts {

/// The failure "Cannot OPERATION PATH: REASON" for a system error number. `operation` is a verb
/// with what belongs to it, such as "open".
Failure pathFailure(std::string_view operation, std::string_view path, int number);
/// The same for a reason that the system has no number for.
Failure pathFailure(std::string_view operation, std::string_view path, std::string_view reason);

/// The failure for something at a path that is no regular file; `mode` is what stat gave for it.
Failure notRegularFailure(std::string_view operation, std::string_view path, mode_t mode);

/// Success for the system error number 0, otherwise the failure as above.
inline Result asResult(std::string_view operation, std::string_view path, int number) {
  return number == 0 ? Result() : pathFailure(operation, path, number);
}

}  // namespace accounts
