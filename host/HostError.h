#pragma once

#include <string>

#include "host/ExitStatus.h"

namespace accounts {

/// An error of the host's own: what to tell the person, in one sentence without a full stop, and
/// how the program ends.
struct HostError {
  ExitStatus exitStatus = ExitStatus::InputOutputError;
  std::string message;
};

}  // namespace accounts
