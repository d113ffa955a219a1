#include "safetynet/SharedIdentifiers.h"

#include "vocabulary/AccountVocabulary.h"

namespace accounts {

SharedIdentifiers::SharedIdentifiers(const std::array<PropertyArray, 5>& inputs) {
  for (std::size_t kind = 0; kind < inputs.size(); ++kind) {
    for (const PropertyValue& element : inputs[kind]) {
      count(element, keysOf(static_cast<AccountOrigin::Kind>(kind)).identifier);
      const PropertyDictionary* const account = element.asDictionary();
      if (account != nullptr) {
        for (const PropertyValue& child :
             account->arrayForKey(kAccountChildAccounts).value_or(PropertyArray())) {
          count(child, kAccountIdentifier);
        }
      }
    }
  }
}

bool SharedIdentifiers::isShared(const Text& identifier) const {
  const auto found = counts_.find(identifier.string());
  return found != counts_.end() && found->second > 1;
}

void SharedIdentifiers::count(const PropertyValue& element, std::string_view key) {
  const PropertyDictionary* const account = element.asDictionary();
  if (const auto identifier = account != nullptr ? account->textForKey(key) : std::nullopt) {
    ++counts_[identifier->string()];
  }
}

}  // namespace accounts
