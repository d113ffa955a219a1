#pragma once

#include <optional>
#include <string>
#include <vector>

#include "inspection/ListedAccount.h"
#include "inspection/PropertyDifference.h"
#include "inspection/StoreLayout.h"
#include "propertylist/value/PropertyValue.h"
#include "propertylist/value/SecretKeys.h"

namespace accounts {

/// What became of one account. Without a `before` it was added, without an `after` removed.
struct AccountChange {
  std::optional<ListedAccount> before;
  std::optional<ListedAccount> after;
  /// Whether it has another parent: it became a child, a top-level account or another's child.
  bool hasMoved = false;
  /// Of an account that is in both; its children are accounts of their own.
  std::vector<PropertyChange> properties;
};

/// How two files of one kind differ.
struct StoreDifference {
  /// What stands beside the accounts.
  std::vector<PropertyChange> properties;
  /// Those that are in the newer file in its order, then those that are in the older one alone.
  std::vector<AccountChange> accounts;
  /// Whether the accounts that stayed stand in another order.
  bool hasOtherOrder = false;

  [[nodiscard]] bool isEmpty() const {
    return properties.empty() && accounts.empty() && !hasOtherOrder;
  }
};

/// Of each top-level account of a newer file the index of the same one among those of the older
/// one; none for one that was not there.
using Partners = std::vector<std::optional<std::size_t>>;

/// Compares two roots of one kind. With `partners` these tell which top-level accounts are the
/// same, as whoever changed them says, and identifiers tell of children and of what is left.
/// Otherwise accounts are the same if they have the same identifier; several with one identifier
/// are compared in their order, as are those without one that have the same type and name. Of what
/// is left, an account that alone has its type and name on both sides is the same with another
/// identifier.
StoreDifference differenceBetween(const PropertyDictionary& before, const PropertyDictionary& after,
                                  FileKind kind, Secrets secrets,
                                  const std::optional<Partners>& partners = std::nullopt);

}  // namespace accounts
