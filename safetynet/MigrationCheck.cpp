#include "safetynet/MigrationCheck.h"

#include <algorithm>
#include <cstddef>
#include <set>

#include "vocabulary/AccountClasses.h"
#include "vocabulary/AccountVocabulary.h"

namespace accounts {
namespace {

/// The identifier of the device's own account, which a migration makes anew where it is missing.
constexpr std::string_view kDeviceLocalIdentifier = kDeviceLocalAccountClass;

using Identifiers = std::set<std::string, std::less<>>;

PropertyArray arrayIn(const PropertyDictionary& dictionary, std::string_view key) {
  return dictionary.arrayForKey(key).value_or(PropertyArray());
}

std::optional<std::string> identifierIn(const PropertyValue& account, std::string_view key) {
  const PropertyDictionary* const properties = account.asDictionary();
  const auto text = properties != nullptr ? properties->textForKey(key) : std::nullopt;
  return text ? std::optional(text->string()) : std::nullopt;
}

void addIdentifiers(Identifiers& identifiers, const PropertyArray& accounts,
                    std::string_view key = kAccountIdentifier) {
  for (const PropertyValue& account : accounts) {
    if (const auto identifier = identifierIn(account, key)) {
      identifiers.insert(*identifier);
    }
  }
}

/// The identifiers of all accounts of a settings file, children included.
Identifiers identifiersOf(const PropertyDictionary& settings) {
  Identifiers identifiers;
  const PropertyArray accounts = arrayIn(settings, kPlistAccountsKey);
  addIdentifiers(identifiers, accounts);
  for (const PropertyValue& account : accounts) {
    if (account.asDictionary() != nullptr) {
      addIdentifiers(identifiers, arrayIn(*account.asDictionary(), kAccountChildAccounts));
    }
  }
  return identifiers;
}

}  // namespace

bool isMigrated(const std::optional<PropertyDictionary>& settings) {
  const PropertyValue* const version = settings ? settings->find(kPlistVersionKey) : nullptr;
  return version != nullptr && version->integerValue() == kMigratedVersion;
}

std::vector<std::string> accountsBrought(const std::optional<PropertyDictionary>& before,
                                         const std::optional<PropertyDictionary>& after,
                                         std::size_t most) {
  Identifiers known = identifiersOf(before.value_or(PropertyDictionary()));
  known.emplace(kDeviceLocalIdentifier);
  std::vector<std::string> brought;
  for (const std::string& each : identifiersOf(after.value_or(PropertyDictionary()))) {
    if (!known.contains(each) && brought.size() < most) {
      brought.push_back(each);
    }
  }
  return brought;
}

bool hasAnyAccount(const std::optional<PropertyDictionary>& settings,
                   const std::vector<std::string>& identifiers) {
  const Identifiers held = identifiersOf(settings.value_or(PropertyDictionary()));
  return std::ranges::any_of(identifiers,
                             [&](const std::string& each) { return held.contains(each); });
}

std::optional<std::string> whyNotMigrated(Transaction& transaction) {
  if (transaction.lastSave() == LastSave::Failed) {
    const std::optional<std::string>& reason = transaction.saveFailure();
    return "the settings file was not written" + (reason ? ": " + *reason : "");
  }
  const std::optional<PropertyDictionary> contents =
      transaction.dictionaryAt(DevicePlace::Settings);
  if (isMigrated(contents)) {
    return std::nullopt;
  }
  std::string reason = contents ? "the settings file has not the current version"
                                : "the settings file cannot be read as a property list";
  const PlaceState& sentinel = transaction.snapshot().at(DevicePlace::RemovalSentinel);
  if (transaction.lastSave() == LastSave::None && sentinel.identity.exists()) {
    reason += ", although " + sentinel.path +
              " says that the legacy stores were being removed after a migration; without that "
              "file a run migrates them";
  }
  return reason;
}

}  // namespace accounts
