#include "safetynet/MigrationCheck.h"

#include <algorithm>
#include <cstddef>
#include <set>

#include "safetynet/PutBack.h"

namespace accounts {
namespace {

constexpr std::string_view kVersion = "Version";
constexpr std::string_view kAccounts = "Accounts";
constexpr std::string_view kChildAccounts = "ChildAccounts";
constexpr std::string_view kIdentifier = "Identifier";
/// The identifier of the device's own account, which a migration makes anew where it is missing.
constexpr std::string_view kDeviceLocalIdentifier = "DeviceLocalAccount";

/// The arrays of a legacy store, and the key of an account's identifier in them.
struct LegacyLayout {
  std::vector<std::string_view> arrays;
  std::string_view identifier;
};
const LegacyLayout kMailLayout = {{"DeliveryAccounts", "MailAccounts"}, "uniqueId"};
const LegacyLayout kExchangeLayout = {{"DAAccountsKey"}, "DAAccountConfigurationAccountID"};

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
                    std::string_view key = kIdentifier) {
  for (const PropertyValue& account : accounts) {
    if (const auto identifier = identifierIn(account, key)) {
      identifiers.insert(*identifier);
    }
  }
}

/// The identifiers of all accounts of a settings file, children included.
Identifiers identifiersOf(const PropertyDictionary& settings) {
  Identifiers identifiers;
  const PropertyArray accounts = arrayIn(settings, kAccounts);
  addIdentifiers(identifiers, accounts);
  for (const PropertyValue& account : accounts) {
    if (account.asDictionary() != nullptr) {
      addIdentifiers(identifiers, arrayIn(*account.asDictionary(), kChildAccounts));
    }
  }
  return identifiers;
}

/// Whether a settings file had accounts of which none is left: as after a plug-in that could not
/// read it. Accounts that come from elsewhere, too, do not count: they are there in any case.
bool hasLostAll(const PropertyDictionary& before, const PropertyDictionary& after,
                const Identifiers& fromElsewhere) {
  if (arrayIn(before, kAccounts).size() == 0) {
    return false;
  }
  const Identifiers left = identifiersOf(after);
  Identifiers identifiers = identifiersOf(before);
  std::erase_if(identifiers, [&](const auto& each) { return fromElsewhere.contains(each); });
  // Accounts without identifiers cannot be looked for: they are given fresh ones.
  const bool noneIsLeft =
      !identifiers.empty() &&
      std::ranges::none_of(identifiers, [&](const auto& each) { return left.contains(each); });
  return noneIsLeft || arrayIn(after, kAccounts).size() == 0;
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

std::optional<std::string> whyNotMigrated(PropertyLists& propertyLists, const std::string& settings,
                                          LastSave lastSave) {
  if (lastSave == LastSave::Failed) {
    return "the settings file was not written";
  }
  const std::optional<PropertyDictionary> contents = propertyLists.readDictionary(settings);
  if (!contents) {
    return "the settings file cannot be read as a property list";
  }
  const PropertyValue* const version = contents->find(kVersion);
  if (version == nullptr || version->integerValue() != kMigratedVersion) {
    return "the settings file has not the current version";
  }
  return std::nullopt;
}

std::vector<std::string> whatMayBeMissing(PropertyLists& propertyLists, const AccountFiles& files,
                                          const std::vector<std::string>& inputs,
                                          const ReadInput& readInput) {
  std::vector<std::string> sentences;
  const PropertyDictionary migrated =
      propertyLists.readDictionary(files.settings).value_or(PropertyDictionary());
  const Identifiers identifiers = identifiersOf(migrated);
  Identifiers fromElsewhere = {std::string(kDeviceLocalIdentifier)};
  // The settings file comes last, when what the legacy stores hold is known.
  for (const std::string& path : inputs) {
    const auto contents = readInput(path);
    if (!contents) {
      sentences.push_back(path + " could not be read as a property list");
    } else if (path == files.settings) {
      if (hasLostAll(*contents, migrated, fromElsewhere)) {
        sentences.push_back(path + " had accounts and has none of them now");
      }
    } else {
      const LegacyLayout& layout = path == files.legacyMail ? kMailLayout : kExchangeLayout;
      if (!isAmong(identifiers, *contents, layout)) {
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
