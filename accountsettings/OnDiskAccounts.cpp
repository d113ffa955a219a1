#include "accountsettings/OnDiskAccounts.h"

#include <algorithm>
#include <utility>

#include "accountsettings/AccountsManager.h"
#include "accountsettings/Log.h"

namespace accounts {

namespace {

/// The text of an account dictionary under "Identifier"; null for none.
const Text* identifierOf(const PropertyValue& element) {
  const PropertyDictionary* properties = element.asDictionary();
  const PropertyValue* identifier =
      properties != nullptr ? properties->find(kAccountIdentifier) : nullptr;
  return identifier != nullptr ? identifier->asText() : nullptr;
}

PropertyArray childrenOf(const PropertyValue& element) {
  const PropertyDictionary* properties = element.asDictionary();
  return properties != nullptr
             ? properties->arrayForKey(kAccountChildAccounts).value_or(PropertyArray())
             : PropertyArray();
}

}  // namespace

OnDiskAccounts::OnDiskAccounts(PropertyArray onDisk, const OrderedAccounts& inMemory,
                               InMemory state)
    : onDisk_(std::move(onDisk)),
      inMemory_(inMemory),
      state_(state),
      fixers_(AccountsManager::_createRuntimeFixers()) {
  if (_ASLogSystem()->isEnabled()) {
    // Making the store writes lines, about accounts too that nobody looks for.
    store_ = AccountsManager::initWithAccounsInfoArray(onDisk_);
  } else if (hasIdentifiersOfMemory()) {
    isAligned_ = true;
  } else {
    indexIdentifiers();
  }
}

OnDiskAccounts::~OnDiskAccounts() = default;

bool OnDiskAccounts::hasIdentifiersOfMemory() const {
  const std::vector<BasicAccountReference>& accounts = inMemory_.accounts();
  return std::ranges::equal(
             onDisk_, accounts,
             [](const PropertyValue& element, const BasicAccountReference& account) {
               const PropertyDictionary* properties = element.asDictionary();
               if (properties != nullptr && properties->isSameAs(account->properties())) {
                 return account->hasOwnIdentifier();
               }
               const Text* identifier = identifierOf(element);
               return identifier != nullptr && account->identifier() == *identifier;
             }) &&
         inMemory_.haveDifferentIdentifiers();
}

void OnDiskAccounts::indexIdentifiers() {
  lastPositions_.reserve(onDisk_.size());
  previousPositions_.reserve(onDisk_.size());
  for (const PropertyValue& element : onDisk_) {
    Position& previous = previousPositions_.emplace_back();
    if (const Text* identifier = identifierOf(element)) {
      previous = std::exchange(lastPositions_[*identifier], previousPositions_.size() - 1);
    }
  }
}

bool OnDiskAccounts::isAsMemoryKnowsIt(std::size_t index) const {
  if (!isAligned_) {
    return false;
  }
  const PropertyDictionary& properties = *onDisk_.at(index).asDictionary();
  const BasicAccount& account = *inMemory_.accounts()[index];
  if (properties.isSameAs(account.properties())) {
    return state_ == InMemory::AllCanBeKept && account.hasAcceptableProperties();
  }
  return account.wouldBeLoadedAsSaved() && account.originalProperties() &&
         properties.isSameAs(*account.originalProperties());
}

std::optional<PropertyDictionary> OnDiskAccounts::propertiesForAccountAt(std::size_t index) {
  const BasicAccount& account = *inMemory_.accounts()[index];
  if (isAligned_) {
    if (std::optional<PropertyDictionary> properties = propertiesAt(index)) {
      return properties;
    }
  }
  const std::optional<Text> identifier = account.identifier();
  if (!identifier) {
    return std::nullopt;
  }
  if (store_ != nullptr) {
    return propertiesInStore(*identifier);
  }
  const Position* last = lastPositions_.find(*identifier);
  for (Position position = last != nullptr ? *last : std::nullopt; position;) {
    if (std::optional<PropertyDictionary> properties = propertiesAt(*position)) {
      return properties;
    }
    // What makes no account is not tried again for the next account with the identifier.
    position = previousPositions_[*position];
    lastPositions_.set(*identifier, position);
  }
  return isIdentifierOfChild(*identifier) ? propertiesInStore(*identifier) : std::nullopt;
}

/// What a record made of the dictionary at a position would save; none when there would be no
/// record.
std::optional<PropertyDictionary> OnDiskAccounts::propertiesAt(std::size_t position) const {
  const PropertyDictionary& properties = *onDisk_.at(position).asDictionary();
  const BasicAccountReference account = BasicAccount::initWithProperties(properties);
  if (account == nullptr) {
    return std::nullopt;
  }
  FixResult result = FixResult::Unchanged;
  for (const std::unique_ptr<RuntimeFixer>& fixer : fixers_) {
    result = std::max(result,
                      fixer->fixBasicAccountIfNeeded_loggingMessage(*account, "loading accounts"));
  }
  return result != FixResult::CannotBeKept ? std::optional(account->propertiesToSave())
                                           : std::nullopt;
}

std::optional<PropertyDictionary> OnDiskAccounts::propertiesInStore(const Text& identifier) {
  if (store_ == nullptr) {
    store_ = AccountsManager::initWithAccounsInfoArray(onDisk_);
  }
  const BasicAccountReference account = store_->accountWithIdentifier(identifier);
  return account != nullptr ? std::optional(account->propertiesToSave()) : std::nullopt;
}

bool OnDiskAccounts::isIdentifierOfChild(const Text& identifier) {
  if (!childIdentifiers_) {
    childIdentifiers_.emplace();
    for (const PropertyValue& element : onDisk_) {
      for (const PropertyValue& child : childrenOf(element)) {
        if (const Text* childIdentifier = identifierOf(child)) {
          childIdentifiers_->insert(*childIdentifier);
        }
      }
    }
  }
  return childIdentifiers_->contains(identifier);
}

}  // namespace accounts
