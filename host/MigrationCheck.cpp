#include "host/MigrationCheck.h"

#include <cstddef>
#include <set>

#include "host/PutBack.h"

namespace accounts {
namespace {

constexpr std::string_view kVersion = "Version";
constexpr std::string_view kAccounts = "Accounts";
constexpr std::string_view kChildAccounts = "ChildAccounts";
constexpr std::string_view kIdentifier = "Identifier";

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

void addIdentifiers(Identifiers& identifiers, const PropertyArray& accounts) {
  for (const PropertyValue& account : accounts) {
    if (const auto identifier = identifierIn(account, kIdentifier)) {
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
                                          const std::vector<std::string>& keptInputs,
                                          const std::string& folder) {
  std::vector<std::string> sentences;
  const PropertyDictionary migrated =
      propertyLists.readDictionary(files.settings).value_or(PropertyDictionary());
  const Identifiers identifiers = identifiersOf(migrated);
  for (const std::string& path : keptInputs) {
    const auto contents = propertyLists.readDictionary(keptPath(folder, path));
    if (!contents) {
      sentences.push_back(path + " could not be read as a property list");
    } else if (path == files.settings) {
      if (arrayIn(*contents, kAccounts).size() > 0 && arrayIn(migrated, kAccounts).size() == 0) {
        sentences.push_back(path + " had accounts and has none now");
      }
    } else if (!isAmong(identifiers, *contents,
                        path == files.legacyMail ? kMailLayout : kExchangeLayout)) {
      sentences.push_back("Not every account of " + path + " was found in the settings file");
    }
  }
  return sentences;
}

}  // namespace accounts
