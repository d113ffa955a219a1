#pragma once

#include <string>
#include <string_view>
#include <utility>
#include <vector>

#include "propertylist/value/PropertyValue.h"
#include "vocabulary/AccountVocabulary.h"
#include "vocabulary/LegacyStoreKeys.h"

// What the old stores and the settings file hold, in a few words.

namespace accounts {

/// An account with a host of its own.
inline PropertyDictionary anAccount(std::string_view identifier, std::string_view type,
                                    std::string_view accountClass) {
  return {{kAccountIdentifier, identifier},
          {kAccountType, type},
          {kAccountClass, accountClass},
          {"Hostname", std::string(identifier) + ".example"}};
}
/// A dictionary with one more value.
inline PropertyDictionary with(PropertyDictionary account, std::string_view key,
                               PropertyValue value) {
  account.set(key, std::move(value));
  return account;
}
/// A dictionary without one of its values.
inline PropertyDictionary without(PropertyDictionary account, std::string_view key) {
  account.remove(key);
  return account;
}
/// The root of a settings file.
inline PropertyDictionary settings(int version, std::vector<PropertyValue> accounts) {
  return {{kPlistVersionKey, version}, {kPlistAccountsKey, PropertyArray(std::move(accounts))}};
}
/// The root of a current settings file.
inline PropertyDictionary settings(std::vector<PropertyValue> accounts) {
  return settings(12, std::move(accounts));
}
/// A legacy description whose name and password are its own.
inline PropertyDictionary mailDescription(std::string_view identifier,
                                          std::string_view accountClass) {
  return {{kLegacyMailIdentifier, identifier},
          {kLegacyMailClass, accountClass},
          {kLegacyMailDisplayName, std::string("Name of ") + std::string(identifier)},
          {"Password", std::string("of ") + std::string(identifier)}};
}
inline PropertyDictionary exchangeDescription(std::string_view identifier) {
  return {{kLegacyExchangeIdentifier, identifier},
          {kLegacyExchangeClass, "ASAccount"},
          {"Password", std::string("of ") + std::string(identifier)}};
}
inline PropertyDictionary mailStore(std::vector<PropertyValue> incoming,
                                    std::vector<PropertyValue> outgoing = {}) {
  return {{kLegacyIncomingAccounts, PropertyArray(std::move(incoming))},
          {kLegacyOutgoingAccounts, PropertyArray(std::move(outgoing))}};
}
inline PropertyDictionary exchangeStore(std::vector<PropertyValue> descriptions) {
  return {{kLegacyExchangeAccounts, PropertyArray(std::move(descriptions))}};
}

}  // namespace accounts
