#pragma once

#include <optional>
#include <span>
#include <string_view>
#include <utility>

#include "accountsettings/AccountsManager.h"
#include "accountsettings/Log.h"
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

/// Converts the descriptions of a legacy array in order. None at the first one that `convert` gives
/// no record for or that is no dictionary, after a console line made of `failureLine`, `operation`
/// and the description. `convert` takes a dictionary and gives a record or null.
template <class Convert>
std::optional<AccountsManager::Accounts> convertDescriptions(const PropertyArray& descriptions,
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
      return std::nullopt;
    }
    records.push_back(std::move(record));
  }
  return records;
}

}  // namespace accounts
