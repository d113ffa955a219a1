#pragma once

#include <vector>

#include "accountsettings/OrderedAccounts.h"
#include "accountsettings/RuntimeFixer.h"
#include "propertylist/value/PropertyValue.h"

namespace accounts {

/// What a store wrote last, as long as another store that is made of it would hold the same
/// dictionaries and write no line. Then nobody needs to make one to know what is on disk.
class NewestSave {
 public:
  /// Takes the array that was just written, the accounts that it was merged from, in the same
  /// order, and the gravest of what the runtime fixers did with these before.
  void note(const PropertyArray& written, const OrderedAccounts& inMemory, FixResult fixing);

  /// Whether the array is the one that was written last, and the accounts in memory still have its
  /// identifiers, place by place.
  [[nodiscard]] bool isThere(const PropertyArray& onDisk, const OrderedAccounts& inMemory) const;

 private:
  /// Empty when a store made of it would differ from it.
  PropertyArray written_;
  /// By place; all different.
  std::vector<Text> identifiers_;
};

}  // namespace accounts
