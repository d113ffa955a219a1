#include "accountsctl/ConvertCommand.h"

#include <optional>

#include "accountsctl/JSONText.h"
#include "accountsctl/PropertyListInput.h"
#include "platform/linux/FileContents.h"
#include "propertylist/binary/BinaryPropertyList.h"
#include "propertylist/xml/XMLPropertyList.h"

namespace accounts {

CommandResult convert(const ConvertOptions& options, const CommandWorker& worker) {
  const auto input = readPropertyListInputs({options.input}, worker);
  if (!input) {
    return input.error();
  }
  auto* const write =
      options.form == PropertyListForm::XML ? &writeXMLPropertyList : &writeBinaryPropertyList;
  auto bytes = write(input->front());
  if (!bytes) {
    return ProgramError{ExitStatus::MalformedInput, bytes.error().text};
  }
  if (options.output == kStandardStream) {
    return CommandReport{*std::move(bytes)};
  }
  if (!options.reportsJSON) {
    return CommandReport{.text = {}, .file = *std::move(bytes)};
  }
  JSON object = reportObject("convert");
  object["input"] = options.input;
  object["output"] = options.output;
  return CommandReport{.text = lineOf(std::move(object), ExitStatus::Success),
                       .file = *std::move(bytes)};
}

}  // namespace accounts
