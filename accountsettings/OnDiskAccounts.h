#pragma once

#include <cstddef>
#include <memory>
#include <optional>

#include "accountsettings/NewestSave.h"
#include "accountsettings/OrderedAccounts.h"
#include "propertylist/value/PropertyValue.h"

namespace accounts {

class AccountsManager;

/// The accounts of the account settings file at the time of a save, as a store made from the file
/// has them. Such a store is made only if the file is not the one that was saved last.
class OnDiskAccounts {
 public:
  /// Takes the array of account dictionaries in the file, what was saved last, and the accounts in
  /// memory, which must outlive this and stay as they are.
  OnDiskAccounts(PropertyArray onDisk, const NewestSave& lastSave, const OrderedAccounts& inMemory);
  OnDiskAccounts(const OnDiskAccounts&) = delete;
  OnDiskAccounts& operator=(const OnDiskAccounts&) = delete;
  ~OnDiskAccounts();

  /// The properties on disk of the account with the identifier of the account in memory at an
  /// index, or of the parent of the child with it; none when the disk has no such account.
  [[nodiscard]] std::optional<PropertyDictionary> propertiesForAccountAt(std::size_t index) const;

 private:
  PropertyArray onDisk_;
  const OrderedAccounts& inMemory_;
  /// Null when the file's dictionaries are those of the accounts in memory, place by place.
  std::unique_ptr<AccountsManager> store_;
};

}  // namespace accounts
