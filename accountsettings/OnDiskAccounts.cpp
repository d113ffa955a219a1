#include "accountsettings/OnDiskAccounts.h"

#include <utility>

#include "accountsettings/AccountsManager.h"

namespace accounts {

OnDiskAccounts::OnDiskAccounts(PropertyArray onDisk, const NewestSave& lastSave,
                               const OrderedAccounts& inMemory)
    : onDisk_(std::move(onDisk)), inMemory_(inMemory) {
  if (!lastSave.isThere(onDisk_, inMemory_)) {
    store_ = AccountsManager::initWithAccounsInfoArray(onDisk_);
  }
}

OnDiskAccounts::~OnDiskAccounts() = default;

std::optional<PropertyDictionary> OnDiskAccounts::propertiesForAccountAt(std::size_t index) const {
  if (store_ == nullptr) {
    return *onDisk_.at(index).asDictionary();
  }
  const std::optional<Text> identifier = inMemory_.accounts()[index]->identifier();
  const BasicAccountReference account =
      identifier ? store_->accountWithIdentifier(*identifier) : nullptr;
  return account != nullptr ? std::optional(account->propertiesToSave()) : std::nullopt;
}

}  // namespace accounts
