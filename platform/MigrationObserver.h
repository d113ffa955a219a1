#pragma once

#include <optional>
#include <string_view>
#include <vector>

#include "platform/AccountFate.h"
#include "propertylist/value/PropertyValue.h"

namespace accounts {

/// The accounts in memory at one moment.
struct AccountsInMemory {
  /// What a settings file of them would hold.
  PropertyDictionary settings;
  /// Which account each top-level one is, in the order of the file.
  std::vector<AccountOrigin> origins;
};

/// Is told what a migration does, stage by stage, on the migration's own thread. No stage begins
/// before the one before it has ended.
class MigrationObserver {
 public:
  virtual ~MigrationObserver() = default;

  /// Whether stageEnded() is to have the accounts, which takes longer the more there are.
  [[nodiscard]] virtual bool wantsAccounts() const { return true; }

  /// A stage begins. `operation` is the name of the operation that it runs, `purpose` says in a
  /// few words for people what that is for.
  virtual void stageBegan(std::string_view operation, std::string_view purpose) = 0;

  /// The stage that began last has ended, with these accounts; none where they are not in memory or
  /// not wanted.
  virtual void stageEnded(bool succeeded, const std::optional<AccountsInMemory>& accounts) = 0;

  /// An account of the store that is migrated, not of one that a save makes to look at the file,
  /// met a fate.
  virtual void accountFared(const AccountEvent& event) { static_cast<void>(event); }

  /// The store was saved for the last time: its top-level accounts, in the order of the file.
  virtual void accountsSaved(const std::vector<AccountOrigin>& accounts) {
    static_cast<void>(accounts);
  }
};

}  // namespace accounts
