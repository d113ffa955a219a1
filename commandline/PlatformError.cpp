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

}  // namespace

ProgramError programErrorOf(const LinuxPlatformError& error) {
  return programErrorOf(error.failure, exitStatusOf(error.kind));
}

ProgramError programErrorOf(const Failure& failure, ExitStatus lasting) {
  return {exitStatusOf(failure, lasting), failure.text};
}

OrProgramError<void> checkIsDevice(const DeviceRoot& root, std::string_view name) {
  std::string missing;
  for (const std::string_view each : kDeviceDirectories) {
    // What cannot be looked at is there, as far as this is concerned.
    const auto opened = root.open(each, O_PATH | O_DIRECTORY);
    if (opened || opened.error().number != ENOENT) {
      return {};
    }
    missing.append(missing.empty() ? "" : ", ").append(each);
  }
  return ProgramError{ExitStatus::MissingInput,
                      std::string(name) + " has none of the directories that every device has (" +
                          missing + "): is the image mounted?"};
}

}  // namespace accounts
