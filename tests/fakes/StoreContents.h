#pragma once

#include <initializer_list>
#include <string_view>
#include <utility>
#include <vector>

#include "propertylist/value/PropertyValue.h"
#include "vocabulary/AccountVocabulary.h"
#include "vocabulary/LegacyStoreKeys.h"

// What the old stores and the settings file hold, in a few words.

namespace accounts {

/// An account dictionary in the making, such as
/// `anAccount("A", kMailAccountType, "IMAPAccount").with(kAccountUsername, "jo")`.
class AccountDictionary {
 public:
  explicit AccountDictionary(PropertyDictionary properties) : properties_(std::move(properties)) {}
  /// Of what stands in a list of accounts.
  explicit AccountDictionary(const PropertyValue& account) : properties_(*account.asDictionary()) {}

  [[nodiscard]] AccountDictionary with(std::string_view key, PropertyValue value) const {
    AccountDictionary changed = *this;
    changed.properties_.set(key, std::move(value));
    return changed;
  }
  /// With further entries; of two with one key the later one holds.
  [[nodiscard]] AccountDictionary with(const PropertyDictionary& further) const {
    AccountDictionary changed = *this;
    for (const auto& [key, value] : further) {
      changed.properties_.set(key, value);
    }
    return changed;
  }
  [[nodiscard]] AccountDictionary without(std::string_view key) const {
    AccountDictionary changed = *this;
    changed.properties_.remove(key);
    return changed;
  }
  [[nodiscard]] AccountDictionary enabledFor(std::initializer_list<std::string_view> names) const {
    return with(kAccountEnabledDataclasses, listOf(names));
  }
  [[nodiscard]] AccountDictionary provisionedFor(
      std::initializer_list<std::string_view> names) const {
    return with(kAccountProvisionedDataclasses, listOf(names));
  }
  [[nodiscard]] AccountDictionary withChildren(PropertyArray children) const {
    return with(kAccountChildAccounts, std::move(children));
  }

  operator PropertyDictionary() const { return properties_; }
  operator PropertyValue() const { return properties_; }

 private:
  static PropertyArray listOf(std::initializer_list<std::string_view> names) {
    return PropertyArray(std::vector<PropertyValue>(names.begin(), names.end()));
  }
  PropertyDictionary properties_;
};

/// An account of the settings file.
inline AccountDictionary anAccount(std::string_view identifier, std::string_view type,
                                   std::string_view accountClass) {
  return AccountDictionary(
      {{kAccountIdentifier, identifier}, {kAccountType, type}, {kAccountClass, accountClass}});
}
/// An account as the old stores describe it.
inline AccountDictionary aMailDescription(std::string_view identifier,
                                          std::string_view accountClass) {
  return AccountDictionary({{kLegacyMailIdentifier, identifier}, {kLegacyMailClass, accountClass}});
}
inline AccountDictionary anExchangeDescription(std::string_view identifier) {
  return AccountDictionary(
      {{kLegacyExchangeIdentifier, identifier}, {kLegacyExchangeClass, "ASAccount"}});
}

/// What the settings file and the old stores hold.
inline PropertyDictionary accountSettings(PropertyValue version, PropertyArray accounts = {}) {
  return {{kPlistVersionKey, std::move(version)}, {kPlistAccountsKey, std::move(accounts)}};
}
inline PropertyDictionary mailStore(PropertyArray incoming, PropertyArray outgoing = {}) {
  return {{kLegacyIncomingAccounts, std::move(incoming)},
          {kLegacyOutgoingAccounts, std::move(outgoing)}};
}
inline PropertyDictionary exchangeStore(PropertyArray descriptions) {
  return {{kLegacyExchangeAccounts, std::move(descriptions)}};
}

}  // namespace accounts
