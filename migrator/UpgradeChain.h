#pragma once

#include <array>
#include <cstdint>
#include <span>

#include "migrator/AccountsDataMigrator.h"
#include "migrator/UpgradeStep.h"
#include "vocabulary/MigrationStages.h"

namespace accounts {

/// Every upgrade step in its fixed order. To add one: raise `kMigratedVersion`
/// (vocabulary/DevicePlaces.h) and append a row.
inline constexpr std::array<UpgradeStep, 12> kUpgradeChain = {{
    {0, kStep7A149, "Stamp version 1", &AccountsDataMigrator::_migrateAccountsFrom7A149},
    {1, kStep7A150, "Give accounts their unique identifiers",
     &AccountsDataMigrator::_migrateAccountsFrom7A150},
    {2, kStep7A153, "Make the on-device account anew",
     &AccountsDataMigrator::_migrateAccountsFrom7A153},
    {3, kStep7A241, "Switch notes off for the hosted mail service",
     &AccountsDataMigrator::_migrateAccountsFrom7A241},
    {4, kStep7A242, "Join web-mail accounts and their calendars",
     &AccountsDataMigrator::_migrateAccountsFrom7A242},
    {5, kStep8A293, "Switch notes off on the oldest processor",
     &AccountsDataMigrator::_migrateAccountsFrom8A293},
    {6, kStep8B117, "Put hosted mail accounts under parent accounts",
     &AccountsDataMigrator::_migrateAccountsFrom8B117},
    {7, kStep8C136, "Tidy hosted accounts and enable mail",
     &AccountsDataMigrator::_migrateAccountsFrom8C136},
    {8, kStep8F191, "Stamp version 9", &AccountsDataMigrator::_migrateAccountsFrom8F191},
    {9, kStep9A182, "Find the primary cloud account and provision reminders",
     &AccountsDataMigrator::_migrateAccountsFrom9A182},
    {10, kStep9A334, "Settle secondary cloud accounts and provisioning",
     &AccountsDataMigrator::_migrateAccountsFrom9A334},
    {11, kStep9B176, "Add the wallet to the primary account, announce cloud tabs",
     &AccountsDataMigrator::_migrateAccountsFrom9B176},
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

static_assert(hasConsecutiveVersions(kUpgradeChain));
static_assert(kUpgradeChain.back().entryVersion + 1 == AccountsManager::currentVersion());

}  // namespace accounts
