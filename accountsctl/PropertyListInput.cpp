#include "accountsctl/PropertyListInput.h"

#include <optional>

#include "commandline/PlatformError.h"
#include "platform/linux/FileContents.h"
#include "propertylist/PropertyListFile.h"

namespace accounts {

std::variant<PropertyValue, ProgramError> readPropertyListInput(const std::string& file) {
  Failure error;
  const std::optional<std::string> bytes = readHostFile(file, error);
  if (!bytes) {
    return programErrorOf(error, ExitStatus::MissingInput);
  }
  PropertyListError malformed;
  std::optional<PropertyValue> value = readPropertyList(*bytes, malformed);
  if (!value) {
    return ProgramError{
        ExitStatus::MalformedInput,
        pathFailure("read the property list", nameOfInput(file), malformed.text).text};
  }
  return *std::move(value);
}

}  // namespace accounts
