#include "safetynet/PlaceErrors.h"

#include <cerrno>
#include <string>

namespace accounts {
namespace {

ExitStatus statusOf(int number, ExitStatus otherwise) {
  switch (number) {
    case EIO:
      return ExitStatus::InputOutputError;
    case EAGAIN:
    case EDQUOT:
    case EMFILE:
    case ENFILE:
    case ENOMEM:
    case ENOSPC:
    case ESTALE:
    case ETIMEDOUT:
      return ExitStatus::TemporaryFailure;
    default:
      return otherwise;
  }
}

}  // namespace

PlaceFailure placeFailureOf(const Result& failure) {
  constexpr int kNoNumber = 0;
  return {failure.kind() == FailureKind::MayPass ? EAGAIN : kNoNumber, failure.error()};
}

ProgramError readingError(const PlaceFailure& failure) {
  // Without a number it is no failure of reading: the device is laid out so that nothing can be
  // replaced safely.
  return {failure.number == 0 ? ExitStatus::CannotCreate
                              : statusOf(failure.number, ExitStatus::MissingInput),
          failure.text};
}

ProgramError writingError(std::string_view operation, const PlaceFailure& failure) {
  return {statusOf(failure.number, ExitStatus::CannotCreate),
          std::string(operation) + ": " + failure.text};
}

}  // namespace accounts
