#include "safetynet/ConvertedDescription.h"

#include <array>
#include <string_view>
#include <utility>

#include "safetynet/AccountLedger.h"
#include "vocabulary/AccountVocabulary.h"
#include "vocabulary/LegacyStoreKeys.h"

namespace accounts {

ConvertedDescription convertedDescription(const PropertyDictionary& description,
                                          AccountOrigin::Kind kind) {
  ConvertedDescription converted = {description, {}};
  if (kind == AccountOrigin::Kind::Settings || kind == AccountOrigin::Kind::Made) {
    return converted;
  }
  const OriginKeys keys = keysOf(kind);
  const std::array<std::pair<std::string_view, std::string_view>, 3> moved = {
      {{keys.accountClass, kAccountClass},
       {keys.displayName, kAccountDisplayName},
       {keys.identifier, kAccountIdentifier}}};
  for (const auto& [legacyKey, key] : moved) {
    std::optional<PropertyValue> value = converted.account.take(legacyKey);
    if (!value) {
      continue;
    }
    const PropertyValue* const present = converted.account.find(key);
    if (present != nullptr && !(*present == *value) && converted.loss.empty()) {
      converted.loss = "its \"" + std::string(key) + "\" gave way to the value under \"" +
                       std::string(legacyKey) + "\"";
    }
    converted.account.set(key, *std::move(value));
  }
  if (kind == AccountOrigin::Kind::Exchange) {
    for (const std::string_view key : kLegacyExchangeSwitches) {
      converted.account.remove(key);
    }
  }
  return converted;
}

}  // namespace accounts
