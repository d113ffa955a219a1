#pragma once

#include <cstdint>
#include <optional>
#include <string>
#include <unordered_map>

#include "platform/AccountFate.h"
#include "propertylist/value/PropertyValue.h"
#include "safetynet/AccountLedger.h"

namespace accounts {

/// Finds the accounts that an earlier run made of the descriptions of a legacy store: by their
/// identifier, and where a description has none, by the values that no rule changes.
class AccountsOfEarlierRun {
 public:
  /// Of the accounts of a settings file, children included. O(what they hold).
  explicit AccountsOfEarlierRun(const PropertyArray& accounts);

  /// Where the account of a description is; none for nowhere.
  [[nodiscard]] std::optional<LedgerPlace> find(const PropertyValue& description,
                                                AccountOrigin::Kind kind) const;

 private:
  void enter(const PropertyValue& account, LedgerPlace place);

  std::unordered_map<std::string, LedgerPlace> byIdentifier_;
  std::unordered_map<std::string, LedgerPlace> byUnchangedValues_;
};

}  // namespace accounts
