#pragma once

#include <cstdint>
#include <string>

#include "accountsctl/CommandResult.h"
#include "accountsctl/CommandWorker.h"

namespace accounts {

/// The two forms of a property-list file.
enum class PropertyListForm : std::uint8_t { XML, Binary };

struct ConvertOptions {
  /// A file of this machine, "-" for standard input.
  std::string input;
  /// A file of this machine, "-" for standard output.
  std::string output;
  PropertyListForm form = PropertyListForm::XML;
  /// Whether the report is a JSON object; not together with standard output.
  bool reportsJSON = false;
};

/// A property list in another form, its values unchanged, secrets included: the report's text for
/// standard output, its file for any other one.
CommandResult convert(const ConvertOptions& options, const CommandWorker& worker);

}  // namespace accounts
