#pragma once

#include <cstdint>
#include <string>

#include "accountsctl/CommandResult.h"

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

/// Writes a property list in another form, its values unchanged, secrets included. The output file
/// appears whole or not at all; a new one can be read by its owner alone, one that is replaced
/// keeps its permissions. Only a regular file is replaced, through symbolic links that lead to it.
CommandResult convert(const ConvertOptions& options);

}  // namespace accounts
