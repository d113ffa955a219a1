#include "accountsctl/PropertyListInput.h"

#include <fcntl.h>
#include <unistd.h>

#include <cerrno>
#include <optional>

#include "platform/linux/FileContents.h"
#include "propertylist/PropertyListFile.h"

namespace accounts {
namespace {

constexpr const char* kNameOfStandardInput = "standard input";

std::optional<std::string> readStandardInput(PathError& error) {
  // A duplicate, since closing the standard stream itself would free its number.
  const FileDescriptor input(fcntl(STDIN_FILENO, F_DUPFD_CLOEXEC, 0));
  return readContents(input, kNameOfStandardInput, error);
}

}  // namespace

std::variant<PropertyValue, ProgramError> readPropertyListInput(const std::string& file) {
  const bool isStandardInput = file == kStandardStream;
  PathError error;
  const std::optional<std::string> bytes =
      isStandardInput ? readStandardInput(error) : readHostFile(file, error);
  if (!bytes) {
    const bool isHardwareError = error.number == EIO;
    return ProgramError{isHardwareError ? ExitStatus::InputOutputError : ExitStatus::MissingInput,
                        error.text};
  }
  PropertyListError malformed;
  std::optional<PropertyValue> value = readPropertyList(*bytes, malformed);
  if (!value) {
    const std::string name = isStandardInput ? kNameOfStandardInput : file;
    return ProgramError{ExitStatus::MalformedInput,
                        pathError("read the property list", name, malformed.text).text};
  }
  return *std::move(value);
}

}  // namespace accounts
