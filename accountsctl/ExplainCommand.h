#pragma once

#include <string>

#include "accountsctl/CommandResult.h"
#include "accountsctl/CommandWorker.h"

namespace accounts {

struct ExplainOptions {
  /// A report of a plan or a run, a file of this machine, "-" for standard input.
  std::string report;
  /// The account's, as it is or as it was named before.
  std::string identifier;
  bool reportsJSON = false;
};

/// Tells what a migration did to one account. An error when the report is none, or has no such
/// account.
CommandResult explain(const ExplainOptions& options, const CommandWorker& worker);

}  // namespace accounts
