#pragma once

#include <array>
#include <cstdint>
#include <span>
#include <string_view>

#include "migrator/AccountsDataMigrator.h"

namespace accounts {

/// One step of the upgrade chain. It takes accounts as the build in its name left them, stored with
/// the entry version, one version forward.
struct UpgradeStep {
  using Operation = bool (AccountsDataMigrator::*)(AccountsManager& store);

  /// The stored version at which the chain starts with this step.
  std::uint64_t entryVersion;
  /// The operation's name.
  std::string_view name;
  Operation run;
};

/// Every upgrade step in its fixed order. To add one: raise AccountsManager::currentVersion() and
/// append a row.
inline constexpr std::array<UpgradeStep, 12> upgradeChain = {{
    {0, "_migrateAccountsFrom7A149:", &AccountsDataMigrator::_migrateAccountsFrom7A149},
    {1, "_migrateAccountsFrom7A150:", &AccountsDataMigrator::_migrateAccountsFrom7A150},
    {2, "_migrateAccountsFrom7A153:", &AccountsDataMigrator::_migrateAccountsFrom7A153},
    {3, "_migrateAccountsFrom7A241:", &AccountsDataMigrator::_migrateAccountsFrom7A241},
    {4, "_migrateAccountsFrom7A242:", &AccountsDataMigrator::_migrateAccountsFrom7A242},
    {5, "_migrateAccountsFrom8A293:", &AccountsDataMigrator::_migrateAccountsFrom8A293},
    {6, "_migrateAccountsFrom8B117:", &AccountsDataMigrator::_migrateAccountsFrom8B117},
    {7, "_migrateAccountsFrom8C136:", &AccountsDataMigrator::_migrateAccountsFrom8C136},
    {8, "_migrateAccountsFrom8F191:", &AccountsDataMigrator::_migrateAccountsFrom8F191},
    {9, "_migrateAccountsFrom9A182:", &AccountsDataMigrator::_migrateAccountsFrom9A182},
    {10, "_migrateAccountsFrom9A334:", &AccountsDataMigrator::_migrateAccountsFrom9A334},
    {11, "_migrateAccountsFrom9B176:", &AccountsDataMigrator::_migrateAccountsFrom9B176},
}};

/// Whether the entry versions of a chain are 0, 1, 2 and so on.
constexpr bool hasConsecutiveVersions(std::span<const UpgradeStep> chain) {
  std::uint64_t expected = 0;
  for (const UpgradeStep& step : chain) {
    if (step.entryVersion != expected) {
      return false;
    }
    ++expected;
  }
  return true;
}

static_assert(hasConsecutiveVersions(upgradeChain));
static_assert(upgradeChain.back().entryVersion + 1 == AccountsManager::currentVersion());

}  // namespace accounts
