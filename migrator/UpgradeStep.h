#pragma once

#include <cstdint>
#include <string_view>

namespace accounts {

class AccountsDataMigrator;
class AccountsManager;

/// One step of the upgrade chain. It takes accounts as the build in its name left them, stored with
/// the entry version, one version forward.
struct UpgradeStep {
  using Operation = bool (AccountsDataMigrator::*)(AccountsManager& store);

  /// The stored version at which the chain starts with this step.
  std::uint64_t entryVersion;
  /// The operation's name.
  std::string_view name;
  /// What it does, in a few words for people.
  std::string_view purpose;
  Operation run;
};

}  // namespace accounts
