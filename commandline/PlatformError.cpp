#include "commandline/PlatformError.h"

namespace accounts {
namespace {

ExitStatus exitStatusOf(LinuxPlatformError::Kind kind) {
  switch (kind) {
    case LinuxPlatformError::Kind::UnusableOption:
      return ExitStatus::UnusableArguments;
    case LinuxPlatformError::Kind::MissingInput:
      return ExitStatus::MissingInput;
    case LinuxPlatformError::Kind::CannotCreate:
      return ExitStatus::CannotCreate;
    case LinuxPlatformError::Kind::InputOutput:
      break;
  }
  return ExitStatus::InputOutputError;
}

}  // namespace

ProgramError programErrorOf(const LinuxPlatformError& error) {
  return ProgramError{exitStatusOf(error.kind), error.text};
}

}  // namespace accounts
