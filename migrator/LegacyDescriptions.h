#pragma once

#include <optional>
#include <span>
#include <string_view>
#include <utility>

#include "accountsettings/AccountsManager.h"
#include "accountsettings/Log.h"
#include "migrator/MigrationStage.h"
#include "propertylist/value/PropertyValue.h"

namespace accounts {

/// A key of a legacy account description and the account key that takes its value over.
struct LegacyKey {
  std::string_view legacyKey;
  std::string_view accountKey;
};

/// Moves the values of a description's legacy keys, of whatever kind, to their account keys. Keys
/// that the description lacks change nothing.
void moveLegacyKeys(PropertyDictionary& description, std::span<const LegacyKey> keys);

/// The account dictionary of a legacy mail description, taken as one of a type: the type given, or
/// the type and type strings of its class if it has one.
PropertyDictionary accountPropertiesOfMailDescription(const PropertyDictionary& description,
                                                      std::string_view type);

/// The account dictionary of a legacy Exchange description, its dataclass switches turned into a
/// list.
PropertyDictionary accountPropertiesOfExchangeDescription(const PropertyDictionary& description);

/// Removes the file that an even older build left beside a legacy store under the same name plus
/// ".original". Failures are ignored.
void removeOriginalBeside(std::string_view legacyPath);

/// Tells that the descriptions of a legacy array stay out, one of their store having been refused.
/// `refused` is the index of that one, if it is among them.
void tellOutWithItsStore(AccountOrigin::Kind array, std::size_t count,
                         std::optional<std::size_t> refused);

/// Converts the descriptions of a legacy array in order. None at the first one that `convert` gives
/// no record for or that is no dictionary, after a console line made of `failureLine`, `operation`
/// and the description; whoever observes the migration is told, too. `convert` takes a dictionary
/// and gives a record or null.
template <class Convert>
std::optional<AccountsManager::Accounts> convertDescriptions(AccountOrigin::Kind array,
                                                             const PropertyArray& descriptions,
                                                             std::string_view operation,
                                                             std::string_view failureLine,
                                                             Convert&& convert) {
  AccountsManager::Accounts records;
  records.reserve(descriptions.size());
  for (const PropertyValue& description : descriptions) {
    const PropertyDictionary* const dictionary = description.asDictionary();
    BasicAccountReference record = dictionary != nullptr ? convert(*dictionary) : nullptr;
    if (record == nullptr) {
      logToConsole(failureLine, {operation, description});
      tellOutWithItsStore(array, descriptions.size(), records.size());
      tellFate({{array, static_cast<std::uint32_t>(records.size())},
                ToldFate::Refused,
                {},
                dictionary == nullptr ? "it is no dictionary" : "it has no class"});
      return std::nullopt;
    }
    record->setOrigin({array, static_cast<std::uint32_t>(records.size())});
    records.push_back(std::move(record));
  }
  return records;
}

}  // namespace accounts
