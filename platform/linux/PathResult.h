#pragma once

#include <string_view>

#include "platform/Result.h"
#include "platform/linux/PathError.h"

namespace accounts {

/// The failure that an error on a path is for the caller of a platform operation.
inline Result asResult(const PathError& error) {
  return Result::failure(error.text, failureKind(error.number));
}

/// Success for the system error number 0, otherwise the failure "Cannot OPERATION PATH: REASON".
inline Result asResult(std::string_view operation, std::string_view path, int number) {
  return number == 0 ? Result::success() : asResult(pathError(operation, path, number));
}

}  // namespace accounts
