#include "commandline/PlatformError.h"

#include <fcntl.h>

#include <algorithm>
#include <cerrno>
#include <string>

#include "vocabulary/DevicePlaces.h"

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
  const bool isOfTheMedium = error.number == EIO;
  return {exitStatusOf(isOfTheMedium ? FailureKind::Lasting : failureKind(error.number),
                       isOfTheMedium ? ExitStatus::InputOutputError : lasting),
          error.text};
}

ProgramError programErrorOf(const Result& failure, ExitStatus lasting) {
  return {exitStatusOf(failure.kind(), lasting), failure.error()};
}

std::optional<ProgramError> whyNoDevice(const DeviceRoot& root, std::string_view name) {
  std::string missing;
  for (const std::string_view each : kDeviceDirectories) {
    PathError error;
    // What cannot be looked at is there, as far as this is concerned.
    if (root.open(each, O_PATH | O_DIRECTORY, error) || error.number != ENOENT) {
      return std::nullopt;
    }
    missing.append(missing.empty() ? "" : ", ").append(each);
  }
  return ProgramError{ExitStatus::MissingInput,
                      std::string(name) + " has none of the directories that every device has (" +
                          missing + "): is the image mounted?"};
}

}  // namespace accounts
