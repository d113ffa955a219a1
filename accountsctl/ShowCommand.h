#pragma once

#include <string>

#include "accountsctl/CommandResult.h"
#include "accountsctl/CommandWorker.h"
#include "accountsctl/TextTable.h"
#include "commandline/Terminal.h"
#include "propertylist/value/PropertyValue.h"
#include "propertylist/value/SecretKeys.h"

namespace accounts {

/// The form in which a file is shown.
enum class ShownForm { Tables, JSON, XML };

struct ShowOptions {
  /// A file of this machine, "-" for standard input.
  std::string file;
  ShownForm form = ShownForm::Tables;
  Secrets secrets = Secrets::Hide;
  /// Whether tables also show every property of each account.
  bool withProperties = false;
  /// What becomes of cells for which a terminal is too narrow.
  LongCells longCells = LongCells::Cut;
};

/// Shows a file, whatever kind of property list it is.
CommandResult show(const ShowOptions& options, const Terminal& terminal,
                   const CommandWorker& worker);

/// The tables that show a file's content to people.
std::string shownTables(const PropertyValue& content, const ShowOptions& options,
                        const Terminal& terminal);

}  // namespace accounts
