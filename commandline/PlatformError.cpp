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

ExitStatus exitStatusOf(FailureKind kind, ExitStatus lasting) {
  return kind == FailureKind::MayPass ? ExitStatus::TemporaryFailure : lasting;
}

}  // namespace

ProgramError programErrorOf(const LinuxPlatformError& error) {
  return {exitStatusOf(error.failure, exitStatusOf(error.kind)), error.text};
}

ProgramError programErrorOf(const PathError& error, ExitStatus lasting) {
  return {exitStatusOf(failureKind(error.number), lasting), error.text};
}

ProgramError programErrorOf(const Result& failure, ExitStatus lasting) {
  return {exitStatusOf(failure.kind(), lasting), failure.error()};
}

}  // namespace accounts
