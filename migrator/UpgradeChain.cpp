#include "migrator/UpgradeChain.h"

#include <algorithm>

#include "accountsettings/Process.h"
#include "migrator/MigrationStage.h"
#include "vocabulary/LegacyStoreKeys.h"

namespace accounts {

namespace {

/// The version that a settings file says it has, as an unsigned number.
std::uint64_t storedVersion(const PropertyDictionary& accountSettings) {
  const PropertyValue* const version = accountSettings.find(kPlistVersionKey);
  const std::int64_t number = version != nullptr ? version->integerValue().value_or(0) : 0;
  // Kept on purpose: a negative version becomes a very high one and so counts as up to date; the
  // decision whether to migrate compares in the same way.
  return static_cast<std::uint64_t>(number);
}

}  // namespace

AccountsDataMigrator::AccountsDataMigrator() : AccountsDataMigrator(kUpgradeChain) {}

bool AccountsDataMigrator::_newAccountsInformationPresent() {
  return Process::current().platform.fileSystem.fileExists(
      AccountsManager::fullPathToAccountSettingsPlist());
}

// Kept on purpose: the chain keeps no record of its progress. Its first saving step already writes
// the current version, so a chain that is interrupted after it is not taken up again.
bool AccountsDataMigrator::_migrateNewAccountsInfo(AccountsManager& store) {
  const std::optional<PropertyDictionary> file =
      Process::current().platform.propertyLists.readDictionary(
          AccountsManager::fullPathToAccountSettingsPlist());
  collect(kInformationOldSettings, file);

  // Kept on purpose: the file decides, not the store's data version, so accounts that were just
  // converted from legacy stores go through the same steps as those of the file.
  const std::uint64_t version = storedVersion(file.value_or(PropertyDictionary()));
  if (version >= AccountsManager::currentVersion()) {
    return true;
  }
  const auto entry = std::ranges::find(chain_, version, &UpgradeStep::entryVersion);
  return entry != chain_.end() && std::all_of(entry, chain_.end(), [&](const UpgradeStep& step) {
           return runStage(step.name, step.purpose, store,
                           [&] { return (this->*step.run)(store); });
         });
}

}  // namespace accounts
