#pragma once

#include <string_view>
#include <utility>

#include "accountsettings/AccountsManager.h"

namespace accounts {

/// Tells whoever observes the migration what became of an account.
void tellFate(const AccountEvent& event);

/// Tells which accounts a store that was saved for the last time has, and in which order.
void tellSavedAccounts(const AccountsManager& store);

/// Names an account that the migration makes, for what is told of it.
void nameMadeAccount(BasicAccount& account);

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
