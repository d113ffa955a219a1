#include "accountsctl/ConvertCommand.h"

#include <optional>

#include "accountsctl/JSONText.h"
#include "accountsctl/PropertyListInput.h"
#include "commandline/ReplacedFile.h"
#include "platform/linux/FileContents.h"
#include "propertylist/binary/BinaryPropertyList.h"
#include "propertylist/xml/XMLPropertyList.h"

namespace accounts {

CommandResult convert(const ConvertOptions& options) {
  const std::variant<PropertyValue, ProgramError> input = readPropertyListInput(options.input);
  if (const auto* error = std::get_if<ProgramError>(&input)) {
    return *error;
  }
  PropertyListError unwritable;
  auto* const write =
      options.form == PropertyListForm::XML ? &writeXMLPropertyList : &writeBinaryPropertyList;
  std::optional<std::string> bytes = write(std::get<PropertyValue>(input), unwritable);
  if (!bytes) {
    return ProgramError{ExitStatus::MalformedInput, unwritable.text};
  }
  if (options.output == kStandardStream) {
    return CommandReport{*std::move(bytes)};
  }
  if (std::optional<ProgramError> error = replaceFile(options.output, *bytes)) {
    return *std::move(error);
  }
  if (!options.reportsJSON) {
    return CommandReport{};
  }
  JSON object = reportObject("convert");
  object["input"] = options.input;
  object["output"] = options.output;
  return CommandReport{lineOf(std::move(object), ExitStatus::Success)};
}

}  // namespace accounts
