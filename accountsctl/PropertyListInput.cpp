#include "accountsctl/PropertyListInput.h"

#include <optional>
#include <utility>

#include "commandline/PlatformError.h"
#include "platform/linux/FileContents.h"
#include "propertylist/PropertyListFile.h"

namespace accounts {

OrProgramError<std::vector<PropertyValue>> readPropertyListInputs(
    const std::vector<std::string>& files, const CommandWorker& worker) {
  std::vector<std::string> contents;
  OpenInputs inputs;
  for (const std::string& file : files) {
    auto bytes = readHostFile(file);
    if (!bytes) {
      return programErrorOf(bytes.error(), ExitStatus::MissingInput);
    }
    inputs.size += bytes->size();
    contents.push_back(*std::move(bytes));
  }
  worker.giveUpRights(inputs);
  std::vector<PropertyValue> values;
  for (std::size_t index = 0; index < files.size(); ++index) {
    auto value = readPropertyList(contents[index]);
    if (!value) {
      return ProgramError{
          ExitStatus::MalformedInput,
          pathFailure("read the property list", nameOfInput(files[index]), value.error().text)
              .text};
    }
    values.push_back(*std::move(value));
    contents[index] = {};
  }
  return values;
}

}  // namespace accounts
