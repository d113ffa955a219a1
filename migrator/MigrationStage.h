#pragma once

#include <string_view>
#include <utility>

#include "accountsettings/AccountsManager.h"

namespace accounts {

/// A stage of the migration that runs, from here until end(), for whoever observes it. Costs
/// nothing when nobody does.
class MigrationStage {
 public:
  /// `operation` is the name of the operation that runs, `purpose` what it is for, for people.
  MigrationStage(std::string_view operation, std::string_view purpose);

  /// `store` holds the accounts as they are now; null where they are not in memory.
  void end(bool succeeded, const AccountsManager* store);
};

/// Runs an operation that cannot fail and has no store, as a stage.
template <class Run>
void runStage(std::string_view operation, std::string_view purpose, Run&& run) {
  MigrationStage stage(operation, purpose);
  std::forward<Run>(run)();
  stage.end(true, nullptr);
}

/// Runs an operation on a store that tells whether it succeeded, as a stage. Gives what it gave.
template <class Run>
bool runStage(std::string_view operation, std::string_view purpose, const AccountsManager& store,
              Run&& run) {
  MigrationStage stage(operation, purpose);
  const bool succeeded = std::forward<Run>(run)();
  stage.end(succeeded, &store);
  return succeeded;
}

}  // namespace accounts
