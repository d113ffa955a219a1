#include "propertylist/SecretKeys.h"

#include <algorithm>
#include <optional>
#include <string>

namespace accounts {

namespace {

/// A key with one of these in its name holds a secret. Small letters and digits only.
constexpr std::string_view kSecretWords[] = {"password",   "passwd", "passphrase",    "passcode",
                                             "secret",     "token",  "credential",    "accesskey",
                                             "privatekey", "apikey", "authorization", "cookie"};

std::string lettersAndDigitsOf(std::string_view key) {
  std::string name;
  for (const char character : key) {
    if (character >= 'A' && character <= 'Z') {
      name += static_cast<char>(character - 'A' + 'a');
    } else if ((character >= 'a' && character <= 'z') || (character >= '0' && character <= '9')) {
      name += character;
    }
  }
  return name;
}

bool canBeSecret(const PropertyValue& value) {
  switch (value.kind()) {
    case PropertyKind::Dictionary:
      return !value.asDictionary()->empty();
    case PropertyKind::Array:
      return !value.asArray()->empty();
    case PropertyKind::String:
      return !value.asText()->empty();
    case PropertyKind::Data:
      return !value.asData()->bytes.view().empty();
    case PropertyKind::Integer:
    case PropertyKind::Real:
      return true;
    case PropertyKind::Boolean:
    case PropertyKind::Date:
      return false;
  }
  return true;
}

std::optional<PropertyValue> shownInstead(std::string_view key, const PropertyValue& value);

/// The value with its secrets hidden; none when it has none, as nearly all values do.
std::optional<PropertyValue> shownInstead(const PropertyValue& value) {
  if (const PropertyDictionary* dictionary = value.asDictionary()) {
    std::optional<PropertyDictionary> changed;
    for (const PropertyEntry& entry : *dictionary) {
      if (std::optional<PropertyValue> shown = shownInstead(entry.key, entry.value)) {
        if (!changed) {
          changed = *dictionary;
        }
        changed->set(entry.key, *std::move(shown));
      }
    }
    return changed ? std::optional<PropertyValue>(*std::move(changed)) : std::nullopt;
  }
  if (const PropertyArray* array = value.asArray()) {
    std::optional<PropertyArray> changed;
    for (std::size_t index = 0; index < array->size(); ++index) {
      if (std::optional<PropertyValue> shown = shownInstead(array->at(index))) {
        if (!changed) {
          changed = *array;
        }
        changed->replace(index, *std::move(shown));
      }
    }
    return changed ? std::optional<PropertyValue>(*std::move(changed)) : std::nullopt;
  }
  return std::nullopt;
}

std::optional<PropertyValue> shownInstead(std::string_view key, const PropertyValue& value) {
  return isSecretKey(key) && canBeSecret(value) ? std::optional<PropertyValue>(kHiddenValue)
                                                : shownInstead(value);
}

}  // namespace

bool isSecretKey(std::string_view key) {
  const std::string name = lettersAndDigitsOf(key);
  return std::any_of(std::begin(kSecretWords), std::end(kSecretWords),
                     [&](std::string_view word) { return name.find(word) != std::string::npos; });
}

PropertyValue withSecretsHidden(std::string_view key, const PropertyValue& value) {
  return shownInstead(key, value).value_or(value);
}

PropertyValue withSecretsHidden(const PropertyValue& value) {
  return shownInstead(value).value_or(value);
}

}  // namespace accounts
