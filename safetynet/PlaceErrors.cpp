#include "safetynet/PlaceErrors.h"

#include <string>

namespace accounts {
ProgramError readingError(const Failure& failure) {
  // Without a number it is no failure of reading: the device is laid out so that nothing can be
  // replaced safely.
  return {failure.number == 0 ? ExitStatus::CannotCreate
                              : exitStatusOf(failure, ExitStatus::MissingInput),
          failure.text};
}

ProgramError writingError(std::string_view operation, const Failure& failure) {
  return {exitStatusOf(failure, ExitStatus::CannotCreate),
          std::string(operation) + ": " + failure.text};
}

}  // namespace accounts
