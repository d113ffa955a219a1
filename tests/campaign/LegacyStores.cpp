#include "tests/campaign/LegacyStores.h"

#include "safetynet/CommitRecord.h"
#include "tests/campaign/DeviceProcess.h"
#include "tests/campaign/SettingsContents.h"

namespace accounts {

namespace {

std::string withFurther(const std::optional<std::string>& store, std::string_view key,
                        const PropertyDictionary& account) {
  PropertyDictionary root =
      (store ? dictionaryIn(*store) : std::nullopt).value_or(PropertyDictionary());
  PropertyArray accounts = root.arrayForKey(key).value_or(PropertyArray());
  accounts.append(account);
  root.set(key, accounts);
  return propertyListOf(root);
}

}  // namespace

SimulatedDisk withoutStoresGoneFrom(const SimulatedDisk& other, SimulatedDisk disk) {
  for (const LegacyStore& each : kLegacyStores) {
    for (const std::string& path : {pathOf(each.store), pathOf(each.original)}) {
      if (!other.exists(path)) {
        disk.removeFile(path);
      }
    }
  }
  return disk;
}

std::string withFurtherMailAccount(const std::optional<std::string>& store,
                                   std::string_view identifier) {
  return withFurther(
      store, "MailAccounts",
      {{"AccountType", "IMAPAccount"}, {"uniqueId", identifier}, {"Username", "berta"}});
}

std::string withFurtherExchangeAccount(const std::optional<std::string>& store,
                                       std::string_view identifier) {
  return withFurther(store, "DAAccountsKey",
                     {{"DAAccountConfigurationClass", "ASAccount"},
                      {"DAAccountConfigurationAccountID", identifier},
                      {"DAAccountDescription", "Work"}});
}

}  // namespace accounts
