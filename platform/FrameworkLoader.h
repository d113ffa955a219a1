#pragma once

#include <string_view>

#include "platform/AccountFramework.h"
#include "platform/Result.h"

namespace accounts {

/// Loads frameworks into the process and finds the classes that they bring.
class FrameworkLoader {
 public:
  virtual ~FrameworkLoader() = default;

  /// Loads the framework at a device path at once, all its symbols resolved, and lets it register
  /// its classes. Does nothing for one that is loaded already. A failure carries the loader's own
  /// error text.
  virtual Result loadFramework(std::string_view path) = 0;

  /// The classes that frameworks, and the system itself, made known.
  virtual ClassRegistry& classes() = 0;
};

}  // namespace accounts
