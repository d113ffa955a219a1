#include "accountsctl/ShowCommand.h"

#include "accountsctl/JSONText.h"
#include "accountsctl/PropertyListInput.h"
#include "inspection/StoreLayout.h"
#include "propertylist/value/HiddenSecrets.h"
#include "propertylist/xml/XMLPropertyList.h"

namespace accounts {
namespace {

std::string shownJSON(const PropertyValue& content, const ShowOptions& options) {
  JSON object = reportObject("show");
  object["file"] = options.file;
  object["kind"] = identifierOf(kindOf(content));
  object["content"] = jsonOf(content);
  return lineOf(std::move(object), ExitStatus::Success);
}

CommandResult shownXML(const PropertyValue& content) {
  auto text = writeXMLPropertyList(content);
  if (!text) {
    return ProgramError{ExitStatus::MalformedInput, text.error().text};
  }
  return CommandReport{*std::move(text)};
}

}  // namespace

CommandResult show(const ShowOptions& options, const Terminal& terminal,
                   const CommandWorker& worker) {
  const auto input = readPropertyListInputs({options.file}, worker);
  if (!input) {
    return input.error();
  }
  const PropertyValue& value = input->front();
  const PropertyValue content = options.secrets == Secrets::Hide ? withSecretsHidden(value) : value;
  switch (options.form) {
    case ShownForm::Tables:
      return CommandReport{shownTables(content, options, terminal)};
    case ShownForm::JSON:
      return CommandReport{shownJSON(content, options)};
    case ShownForm::XML:
      return shownXML(content);
  }
  return CommandReport{};
}

}  // namespace accounts
