#pragma once

#include <string>

#include "accountsctl/CommandResult.h"
#include "accountsctl/CommandWorker.h"
#include "commandline/Terminal.h"
#include "propertylist/value/SecretKeys.h"

namespace accounts {

struct DiffOptions {
  /// Files of this machine; one of them may be "-" for standard input.
  std::string before;
  std::string after;
  bool reportsJSON = false;
  Secrets secrets = Secrets::Hide;
};

/// Compares two files of one kind. The exit status of the report is ExitStatus::Attention when they
/// differ. Files of different kinds are an error.
CommandResult diff(const DiffOptions& options, const Terminal& terminal,
                   const CommandWorker& worker);

}  // namespace accounts
