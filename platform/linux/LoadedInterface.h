#pragma once

#include <dlfcn.h>

#include <optional>
#include <string>

#include "platform/AccountFramework.h"

namespace accounts {

/// Why a loaded library cannot be used: it was built with another version of the interface, or with
/// none. None when it can.
inline std::optional<std::string> whyOtherInterface(void* library) {
  void* const function = dlsym(library, kInterfaceVersionFunction);
  const std::string own = std::to_string(kInterfaceVersion);
  if (function == nullptr) {
    return "It was built against other headers: it names no version of its interface, which is " +
           own + " here";
  }
  // dlsym() gives functions as object pointers; POSIX promises that this conversion works.
  const auto version = reinterpret_cast<decltype(&AccountsInterfaceVersion)>(function)();
  return version == kInterfaceVersion
             ? std::nullopt
             : std::optional("It was built against other headers: its interface has version " +
                             std::to_string(version) + ", which is " + own + " here");
}

}  // namespace accounts
