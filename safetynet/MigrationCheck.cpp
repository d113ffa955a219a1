#include "safetynet/MigrationCheck.h"

#include <algorithm>
#include <cstddef>
#include <set>

#include "vocabulary/AccountClasses.h"
#include "vocabulary/AccountVocabulary.h"
#include "vocabulary/LegacyStoreKeys.h"

namespace accounts {
namespace {

/// The identifier of the device's own account, which a migration makes anew where it is missing.
constexpr std::string_view kDeviceLocalIdentifier = kDeviceLocalAccountClass;

/// The arrays of a legacy store, and the key of an account's identifier in them.
struct LegacyLayout {
  std::vector<std::string_view> arrays;
  std::string_view identifier;
};
const LegacyLayout kMailLayout = {{kLegacyOutgoingAccounts, kLegacyIncomingAccounts},
                                  kLegacyMailIdentifier};
const LegacyLayout kExchangeLayout = {{kLegacyExchangeAccounts}, kLegacyExchangeIdentifier};

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

/// Whether a settings file has an account with this identifier, children included.
bool hasAccount(const PropertyDictionary& settings, std::string_view identifier) {
  const auto isIt = [&](const PropertyValue& account) {
    const PropertyDictionary* const properties = account.asDictionary();
    const auto text =
        properties != nullptr ? properties->textForKey(kAccountIdentifier) : std::nullopt;
    return text && text->view() == identifier;
  };
  const PropertyArray accounts = arrayIn(settings, kPlistAccountsKey);
  return std::ranges::any_of(accounts, isIt) ||
         std::ranges::any_of(accounts, [&](const PropertyValue& account) {
           const PropertyDictionary* const properties = account.asDictionary();
           return properties != nullptr &&
                  std::ranges::any_of(arrayIn(*properties, kAccountChildAccounts), isIt);
         });
}

/// Whether a settings file had accounts of which none is left: as after a plug-in that could not
/// read it. Accounts that come from elsewhere, too, do not count: they are there in any case.
bool hasLostAll(const PropertyDictionary& before, const PropertyDictionary& after,
                const Identifiers& fromElsewhere) {
  const PropertyArray accounts = arrayIn(before, kPlistAccountsKey);
  if (accounts.size() == 0) {
    return false;
  }
  // Hardly ever is the first one not there any more.
  const auto first = identifierIn(*accounts.begin(), kAccountIdentifier);
  if (first && !fromElsewhere.contains(*first) && hasAccount(after, *first)) {
    return false;
  }
  const Identifiers left = identifiersOf(after);
  Identifiers identifiers = identifiersOf(before);
  std::erase_if(identifiers, [&](const auto& each) { return fromElsewhere.contains(each); });
  // Accounts without identifiers cannot be looked for: they are given fresh ones.
  const bool noneIsLeft =
      !identifiers.empty() &&
      std::ranges::none_of(identifiers, [&](const auto& each) { return left.contains(each); });
  return noneIsLeft || arrayIn(after, kPlistAccountsKey).size() == 0;
}

/// Whether the accounts of a legacy store are among these. One without an identifier is given a
/// fresh one and cannot be looked for; but a store is carried over as a whole or not at all, so the
/// others speak for it.
bool isAmong(const Identifiers& identifiers, const PropertyDictionary& store,
             const LegacyLayout& layout) {
  std::size_t total = 0;
  std::size_t named = 0;
  std::size_t found = 0;
  for (const std::string_view key : layout.arrays) {
    const PropertyArray accounts = arrayIn(store, key);
    total += accounts.size();
    for (const PropertyValue& account : accounts) {
      const auto identifier = identifierIn(account, layout.identifier);
      named += identifier ? 1 : 0;
      found += identifier && identifiers.contains(*identifier) ? 1 : 0;
    }
  }
  return found == named && (named > 0 || total == 0);
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

std::vector<std::string> whatMayBeMissing(Transaction& transaction,
                                          const std::vector<DevicePlace>& inputs) {
  std::vector<std::string> sentences;
  const PropertyDictionary migrated =
      transaction.dictionaryAt(DevicePlace::Settings).value_or(PropertyDictionary());
  // Made where there is a legacy store to look for.
  std::optional<Identifiers> identifiers;
  Identifiers fromElsewhere = {std::string(kDeviceLocalIdentifier)};
  // The settings file comes last, when what the legacy stores hold is known.
  for (const DevicePlace place : inputs) {
    const std::string& path = transaction.snapshot().at(place).path;
    const auto contents = transaction.dictionaryBefore(place);
    if (!contents) {
      sentences.push_back(path + " could not be read as a property list");
    } else if (place == DevicePlace::Settings) {
      if (hasLostAll(*contents, migrated, fromElsewhere)) {
        sentences.push_back(path + " had accounts and has none of them now");
      }
    } else {
      const LegacyLayout& layout = place == DevicePlace::LegacyMail ? kMailLayout : kExchangeLayout;
      if (!identifiers) {
        identifiers = identifiersOf(migrated);
      }
      if (!isAmong(*identifiers, *contents, layout)) {
        sentences.push_back("Not every account of " + path + " was found in the settings file");
      }
      for (const std::string_view key : layout.arrays) {
        addIdentifiers(fromElsewhere, arrayIn(*contents, key), layout.identifier);
      }
    }
  }
  return sentences;
}

}  // namespace accounts
