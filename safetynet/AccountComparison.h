#pragma once

#include <vector>

#include "propertylist/value/PropertyValue.h"
#include "safetynet/AccountLedger.h"
#include "safetynet/ChangedKeys.h"

namespace accounts {

/// Compares an account as it was with what it is said to be now, value by value. What is not borne
/// out is the reason of its entry in the ledger; `children` get the entries of its children.
class AccountComparison {
 public:
  /// `keys` must outlive this.
  explicit AccountComparison(const ChangedKeys& keys) : keys_(keys) {}

  /// An account that is at the place that its entry says. `isAfterConversion` tells that a
  /// converted one took its place there.
  void compare(LedgerEntry& entry, const PropertyDictionary& before,
               const PropertyDictionary& after, bool isAfterConversion,
               std::vector<LedgerEntry>& children) const;

  /// A hosted mail account that became a child of a parent made from it: what it gave to the parent
  /// must be there, everything else in the child.
  void compareMoved(LedgerEntry& entry, const PropertyDictionary& before,
                    const PropertyDictionary& parent, const PropertyDictionary& now,
                    std::vector<LedgerEntry>& children) const;

 private:
  static void keepChildren(const LedgerEntry& parent, const PropertyArray& accounts,
                           std::vector<LedgerEntry>& children);
  void compareChildren(LedgerEntry& parent, const PropertyDictionary& before,
                       const PropertyDictionary& after, std::vector<LedgerEntry>& children) const;
  void compareChild(LedgerEntry& entry, const PropertyDictionary& parent, const PropertyValue& old,
                    const PropertyValue& now) const;
  [[nodiscard]] static bool mayEnableOnParent(const PropertyDictionary& parent);

  const ChangedKeys& keys_;
};

}  // namespace accounts
